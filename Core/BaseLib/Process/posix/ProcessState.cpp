#include "Core/BaseLib/Process/ProcessState.h"

#include "Core/BaseLib/Log/DebugLog.h"

#include <array>
#include <cerrno>
#include <cfenv>
#include <clocale>
#include <csignal>
#include <cstring>
#include <locale>
#include <string>

#include <fcntl.h>
#include <locale.h>
#include <sys/stat.h>
#include <sys/time.h>
#include <unistd.h>

namespace {

struct SignalAction {
    bool known = false;
    struct sigaction action = {};
};

bool sameAction(const struct sigaction &left, const struct sigaction &right)
{
    return left.sa_flags == right.sa_flags && left.sa_handler == right.sa_handler;
}

mode_t currentUmask()
{
    const mode_t mask = umask(077);
    umask(mask);
    return mask;
}

} // namespace

struct ProcessState::Snapshot {
    std::array<SignalAction, NSIG> actions;
    sigset_t signalMask = {};
    std::string locale;
    std::locale streamLocale; ///< constructed as the global one
    mode_t fileMask = 0;
    int workingFolder = -1;
    std::fenv_t floatingPoint = {};
};

ProcessState::ProcessState()
    : m_snapshot(std::make_unique<Snapshot>())
{
    for (int number = 1; number < NSIG; ++number) {
        SignalAction &entry = m_snapshot->actions[static_cast<std::size_t>(number)];
        entry.known =
            number != SIGKILL && number != SIGSTOP && sigaction(number, nullptr, &entry.action) == 0;
    }
    pthread_sigmask(SIG_SETMASK, nullptr, &m_snapshot->signalMask);
    m_snapshot->locale = std::setlocale(LC_ALL, nullptr);
    m_snapshot->fileMask = currentUmask();
    m_snapshot->workingFolder = open(".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    std::fegetenv(&m_snapshot->floatingPoint);
}

ProcessState::~ProcessState()
{
    if (m_snapshot->workingFolder >= 0)
        close(m_snapshot->workingFolder);
}

void ProcessState::restore() const
{
    for (const int timer : {ITIMER_REAL, ITIMER_VIRTUAL, ITIMER_PROF}) {
        const itimerval none = {};
        setitimer(static_cast<__itimer_which_t>(timer), &none, nullptr);
    }
    for (int number = 1; number < NSIG; ++number) {
        const SignalAction &entry = m_snapshot->actions[static_cast<std::size_t>(number)];
        struct sigaction current = {};
        if (entry.known && sigaction(number, nullptr, &current) == 0 && !sameAction(current, entry.action))
            sigaction(number, &entry.action, nullptr);
    }
    pthread_sigmask(SIG_SETMASK, &m_snapshot->signalMask, nullptr);
    uselocale(LC_GLOBAL_LOCALE);
    if (std::locale() != m_snapshot->streamLocale)
        std::locale::global(m_snapshot->streamLocale);
    if (m_snapshot->locale != std::setlocale(LC_ALL, nullptr))
        std::setlocale(LC_ALL, m_snapshot->locale.c_str());
    umask(m_snapshot->fileMask);
    std::fesetenv(&m_snapshot->floatingPoint);
    if (m_snapshot->workingFolder >= 0 && fchdir(m_snapshot->workingFolder) != 0)
        DebugLog(L"Cannot return to the working folder: %s", std::strerror(errno));
}
