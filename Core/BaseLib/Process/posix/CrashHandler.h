#pragma once

#include <csignal>

/// Describes the fault that is about to end this process, if it was asked to (`CrashReport::install`). Safe
/// in a signal handler.
void describeCrash(int signalNumber, siginfo_t *info, void *context);
