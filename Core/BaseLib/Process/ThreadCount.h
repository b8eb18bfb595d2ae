#pragma once

#include <QtGlobal>

#include <chrono>
#include <set>

/// The system's identifiers of the threads that this process runs now, without those that the system runs for
/// itself; empty when the system does not tell.
std::set<int> runningThreads();

/// True when only the given threads run, waiting up to `patience` for new ones that are just
/// ending: a joined thread may still be listed for a moment.
bool newThreadsEnd(const std::set<int> &before, std::chrono::milliseconds patience);

/// Whether a process of that identifier runs on this machine, also another user's.
bool isProcessRunning(qint64 process);
