#pragma once

#include "Workstation/Summary/ScanSummary.h"

/// Everything known of each plug-in of the summary, one after the other.
QString renderDetails(const ScanSummary &summary);
