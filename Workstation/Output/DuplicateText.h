#pragma once

#include "Workstation/Summary/ScanSummary.h"

/// Plug-ins that are there more than once, and which of them are used; empty where there are none.
QString renderDuplicates(const ScanSummary &summary);
