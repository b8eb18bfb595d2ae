#pragma once

#include "Workstation/Summary/ScanSummary.h"

/// What cannot be used, each reason once, and how to try it again; empty where everything can be used.
QString renderFailures(const ScanSummary &summary);

/// A word as a shell takes it.
QString shellWord(const QString &text);
