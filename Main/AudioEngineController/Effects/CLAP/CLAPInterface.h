#pragma once

// The parts of the CLAP interface that a host of listings needs.

#include <clap/entry.h>
#include <clap/ext/audio-ports.h>
#include <clap/ext/thread-check.h>
#include <clap/plugin-factory.h>

// The host's extension for log messages, which the package leaves out; names and numbers are the
// interface's.

static constexpr char CLAP_EXT_LOG[] = "clap.log";

enum {
    CLAP_LOG_DEBUG = 0,
    CLAP_LOG_INFO = 1,
    CLAP_LOG_WARNING = 2,
};

using clap_log_severity = int32_t;

struct clap_host_log_t {
    /// Any thread.
    void(CLAP_ABI *log)(const clap_host_t *host, clap_log_severity severity, const char *message);
};
