#pragma once

#include <QtGlobal>

class ReWireSystem;

/// Examines the installed ReWire library. Gives 0 when it is recent enough and 1 when an update is required,
/// which includes a library that is not there. Prints the library's version to standard output when one was
/// loaded. Never throws.
int probeReWireVersion() noexcept;
/// The same for the ReWire library of this system; null: one where there is none.
int probeReWireVersion(ReWireSystem *system) noexcept;

/// Formats like `printf` and writes to standard output.
void printReWire(const char *format, ...) Q_ATTRIBUTE_FORMAT_PRINTF(1, 2);
