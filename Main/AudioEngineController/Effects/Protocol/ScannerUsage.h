#pragma once

/// One line of what the scanner's help and its manual page say, which are both made from these tables.
struct UsageRow {
    const char *name; ///< argument, variable or exit code
    const char *text; ///< whole sentences
};

/// The scanner's first argument. There is no second one.
inline constexpr UsageRow kScannerArguments[] = {
    {"FILE", "The scan list: a list of folders, in a folder named Effects. The catalogues are written beside "
             "it. Without an argument it is the workstation's own, below the home folder. A file that is not "
             "there ends the program at once."},
    {"-rewire_version", "Report whether the installed ReWire library is recent enough."},
    {"-h, --help", "Print a summary of arguments, variables and exit codes."},
    {"-v, --version", "Print the version."},
};

/// The environment variables that the scanner reads.
inline constexpr UsageRow kScannerVariables[] = {
    {"FXPROBE_JOBS", "Probe this many plug-ins at once, each in a worker process, 64 at most. Without it "
                     "plug-ins are loaded into the scanner itself, one after the other."},
    {"FXPROBE_PROBE_LIMIT",
     "Give up on a folder, and with workers on a plug-in, that does not answer for this "
     "many seconds; 0 (the default): never."},
    {"FXPROBE_MEMORY_LIMIT", "With workers: give up on a plug-in that takes more memory than this many MiB; "
                             "0 (the default): never."},
    {"FXPROBE_ONLY",
     "Folders and plug-ins of the scan list, separated as in PATH or one a line: search only these, and "
     "keep what is known of all others."},
    {"FXPROBE_LOG", "A file to which the log is appended, in place of standard error."},
    {"FXPROBE_TRACE", "1 adds the trace lines to the log."},
    {"FXPROBE_REPORT", "A file to which the course of the scan is appended."},
    {"FXPROBE_PARENT", "The identifier of a process; when it is gone, the scanner ends as if asked to."},
};

/// How the scanner ends.
inline constexpr UsageRow kScannerExits[] = {
    {"0", "The scan came to its end, whatever it found, or there was nothing to do."},
    {"1", "-rewire_version: an update is needed."},
    {"2", "The scan list, or FXFolders.json beside it, is there and cannot be used; nothing was touched."},
};
