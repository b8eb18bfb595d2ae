#pragma once

#include <QString>
#include <QStringList>

/// Exit codes of fxscan.
namespace ScanExit {
inline constexpr int kDone = 0;
inline constexpr int kFailures = 1;    ///< done, but some plug-ins cannot be used; only with --strict
inline constexpr int kUsage = 2;       ///< the command line makes no sense
inline constexpr int kNotFinished = 3; ///< the scan did not come to its end
} // namespace ScanExit

enum class OutputFormat { Table, Json, JsonLines, Csv, Html };

/// What the command line asks for.
struct ScanOptions {
    QStringList folders; ///< as given; none: the usual ones
    QString dataFolder;  ///< absolute, without a separator at its end
    OutputFormat format = OutputFormat::Table;
    QString html;              ///< file that the page is written to; empty: none
    QStringList forget;        ///< folders that are dropped with what is known of their plug-ins
    QStringList exclude;       ///< folders that are never searched from now on
    QStringList noExclude;     ///< folders that are searched again
    QStringList ignore;        ///< modules and folders whose plug-ins are never loaded from now on
    QStringList noIgnore;      ///< modules and folders whose plug-ins are loaded again
    QStringList retry;         ///< names or paths of plug-ins that get another chance
    bool retryFailed = false;  ///< all of them
    bool retryChanged = false; ///< those of them that may work now
    QStringList rescan;        ///< names or paths of plug-ins that are asked although they did not change
    bool rescanAll = false;
    QStringList only;      ///< words that say which plug-ins are shown; none: all
    QStringList show;      ///< names or paths of plug-ins of which everything is printed
    QStringList switchOff; ///< names or paths of plug-ins whose marks change
    QStringList switchOn;
    QStringList favourite;
    QStringList noFavourite;
    int jobs = 0;        ///< plug-ins probed at once; 0: as many as suit the machine
    int memoryLimit = 0; ///< MiB that a plug-in may take; 0: a share of the machine's
    int timeout = 60;    ///< seconds that one plug-in may take; 0: for ever
    bool listOnly = false;
    bool foldersOnly = false; ///< prints the folders, and nothing else
    bool inProcess = false;
    bool quiet = false;
    bool showWindow = false;
    bool strict = false;

    /// Plug-ins are asked that a scan leaves alone otherwise.
    bool asksAgain() const
    {
        return retryFailed || retryChanged || rescanAll || !retry.isEmpty() || !rescan.isEmpty();
    }
    bool changesMarks() const
    {
        return !(switchOff.isEmpty() && switchOn.isEmpty() && favourite.isEmpty() && noFavourite.isEmpty());
    }
};

/// A command line, read.
struct CommandLine {
    ScanOptions options;
    QString text;         ///< what is to be printed instead of a scan: help, version, or what is wrong
    bool isError = false; ///< `text` says what is wrong
    bool goesOn() const { return text.isEmpty(); }
};

/// Reads the command line, the program's name first.
CommandLine readCommandLine(const QStringList &arguments);
