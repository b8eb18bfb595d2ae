#pragma once

/// Examines the installed ReWire library. Gives 0 when it is recent enough and 1 when an update is required,
/// which includes a library that is not there. Prints the library's version to standard output when one was
/// loaded.
int probeReWireVersion();
