#include <unistd.h>

/// Stands in for `exit` of the C library in the whole process, plug-ins included, and runs no exit handlers.
///
/// The scanner leaves by `leaveProcess` and runs none; but a plug-in that calls exit would. They destroy
/// Qt's objects while the window's thread uses them: the scanner would crash or hang.
extern "C" [[noreturn, gnu::visibility("default")]] void exit(int exitCode) { _exit(exitCode); }
