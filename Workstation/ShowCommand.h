#pragma once

#include "Workstation/Summary/ScanSummary.h"

/// Leaves in a summary the plug-ins that have one of the names, with what their last probes came to. What no
/// name means gives a sentence each.
QStringList keepNamed(ScanSummary &summary, const QStringList &names, const ProbeMemory &memory);
