#pragma once

#include <QString>

/// Sends a line, and then a line end, to the debugger attached to this process, where the system has a
/// channel for it.
void sendLineToDebugger(const QString &line);
