#pragma once

#include "Workstation/Options/ScanOptions.h"

/// fxscan, from its options to its exit code. Returns when everything is printed.
int runFxScan(const ScanOptions &options);
