#pragma once

#include <csignal>
#include <cstddef>

/// Describes the fault that is about to end this process, if it was asked to (`CrashReport::install`). Safe
/// in a signal handler.
void describeCrash(int signalNumber, const siginfo_t *info, const void *context);

/// What a fault was and where it came up, for whoever contains it. Safe in a signal handler.
void describeFault(int signalNumber, const siginfo_t *info, const void *context, char *words,
                   std::size_t size);
