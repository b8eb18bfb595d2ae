/// Stands in for `atexit` in the whole program (the linker's option --wrap) and registers nothing.
///
/// The scanner leaves by `leaveProcess` and runs no exit handlers; but a plug-in that calls exit would. They
/// destroy Qt's objects under the window's thread, and wait for one that this thread is just making,
/// which waits for the lock that exit holds: the scanner would hang.
extern "C" int __wrap_atexit(void (*)()) // NOLINT(bugprone-reserved-identifier): the linker's name
{
    return 0;
}
