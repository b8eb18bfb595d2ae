#include "Core/BaseLib/Process/ProcessSetup.h"

#include <QByteArray>
#include <QTextCodec>

#include <clocale>
#include <csignal>
#include <cstddef>

#include <pthread.h>
#include <pwd.h>
#include <sys/resource.h>
#include <unistd.h>

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>
#endif

namespace {

/// In bytes, as much as the system keeps free below the process's first stack (stack_guard_gap in the
/// kernel's list of parameters).
constexpr std::size_t kStackGuard = std::size_t(1024) * 1024;

/// By default a single page lies between the stacks of two threads: a plug-in's recursion with larger frames
/// steps over it and goes on in the other thread's stack.
void widenStackGuards()
{
    pthread_attr_t attributes;
    if (pthread_getattr_default_np(&attributes) != 0)
        return;
    pthread_attr_setguardsize(&attributes, kStackGuard);
    pthread_setattr_default_np(&attributes);
    pthread_attr_destroy(&attributes);
}

/// No core file, and nothing for a crash reporter: a limit of 0 still feeds a reporter behind a pipe, a limit
/// of 1 byte does neither (core(5)).
void suppressCoreDumps()
{
    rlimit limit = {};
    if (getrlimit(RLIMIT_CORE, &limit) != 0)
        return;
    limit.rlim_cur = limit.rlim_max < 1 ? limit.rlim_max : 1;
    setrlimit(RLIMIT_CORE, &limit);
}

/// Qt tries the platforms of the list in turn and ends the process when all fail; offscreen never fails.
void chooseDisplayPlatform()
{
    QByteArray platforms = qgetenv("QT_QPA_PLATFORM");
    if (platforms.isEmpty()) {
        if (!qEnvironmentVariableIsEmpty("DISPLAY"))
            platforms += "xcb;";
        if (!qEnvironmentVariableIsEmpty("WAYLAND_DISPLAY"))
            platforms += "wayland;";
    } else if (platforms.contains("offscreen") || platforms.contains("minimal")) {
        return;
    } else {
        platforms += ';';
    }
    qputenv("QT_QPA_PLATFORM", platforms + "offscreen");
}

/// A service may run without the variable: what is looked for at home must not land at the root.
void giveHome()
{
    const passwd *account = getenv("HOME") ? nullptr : getpwuid(getuid());
    if (account && account->pw_dir)
        setenv("HOME", account->pw_dir, 1);
}

} // namespace

void prepareProcess()
{
    giveHome();
    suppressCoreDumps();
    widenStackGuards();
    std::signal(SIGPIPE, SIG_IGN);
    std::signal(SIGXFSZ, SIG_IGN); // a file that grows too large fails to be written, as on a full disk
    // File names are bytes; read as UTF-8 they also survive where the locale is "C".
    QTextCodec::setCodecForLocale(QTextCodec::codecForName("UTF-8"));
    chooseDisplayPlatform();
}

void settleLocale() { std::setlocale(LC_NUMERIC, "C"); }

qint64 machineMemory() { return static_cast<qint64>(sysconf(_SC_PHYS_PAGES)) * sysconf(_SC_PAGESIZE); }

void leaveProcess(int exitCode)
{
    // Nothing to flush: what we write is flushed at once, and a plug-in that hangs inside a print call holds
    // that stream's lock.
#if defined(__SANITIZE_ADDRESS__)
    // The check would run in an exit handler, which is left out here.
    __lsan_do_leak_check();
#endif
    _exit(exitCode);
}
