#pragma once

#include <chrono>

/// How many threads this process runs now; 0 when the system does not tell.
int runningThreads();

/// True when no more than `allowed` threads run, waiting up to `patience` for threads that are just ending: a
/// joined thread may still be counted for a moment.
bool threadsSettleTo(int allowed, std::chrono::milliseconds patience);
