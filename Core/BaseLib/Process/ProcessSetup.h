#pragma once

#include <QtGlobal>

/// Prepares the process before the application object exists: a crash brings up no system box, no crash
/// reporter and no core dump, file names are text in the system's own encoding, a closed output pipe does
/// not end the process, a machine without a display gets Qt's offscreen platform, and a Windows program
/// without a console writes into the one from which it was started.
void prepareProcess();

/// To be called when the application object exists, which sets the user's locale: numbers are printed and
/// read with a point again, for us and for plug-ins.
void settleLocale();

/// The machine's memory in bytes.
qint64 machineMemory();

/// Ends the process at once, from any thread: no exit handler and no static destructor runs.
/// Modules that stayed mapped are foreign code, and a crash in their exit handlers would look like a failed
/// scan.
[[noreturn]] void leaveProcess(int exitCode);
