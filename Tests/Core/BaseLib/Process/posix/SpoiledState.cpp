#include "Tests/Core/BaseLib/Process/SpoiledState.h"

#include <QDir>
#include <QTemporaryDir>

#include <cfenv>
#include <clocale>
#include <csignal>
#include <locale>
#include <sstream>

#include <locale.h>
#include <sys/stat.h>
#include <sys/time.h>
#include <unistd.h>
#include <xmmintrin.h>

namespace {

class DecimalComma : public std::numpunct<char> {
    char do_decimal_point() const override { return ','; }
};

void blockUserSignal()
{
    sigset_t mask = {};
    sigaddset(&mask, SIGUSR2);
    pthread_sigmask(SIG_BLOCK, &mask, nullptr);
}

} // namespace

void prepareState() { std::setlocale(LC_ALL, "C.UTF-8"); }

std::string wholeState()
{
    std::ostringstream state;
    state << std::setlocale(LC_ALL, nullptr) << ' ' << 1.5 << ' ' << (uselocale(nullptr) == LC_GLOBAL_LOCALE);
    const mode_t fileMask = umask(0);
    umask(fileMask);
    state << "\nfiles " << fileMask << ' ' << QDir::currentPath().toStdString();
    state << "\nfloating point " << std::fegetround() << ' ' << (_mm_getcsr() & _MM_FLUSH_ZERO_MASK);
    struct sigaction action = {};
    for (const int number : {SIGSEGV, SIGUSR1}) {
        sigaction(number, nullptr, &action);
        state << "\nsignal " << number << ' ' << reinterpret_cast<void *>(action.sa_handler);
    }
    sigset_t mask = {};
    pthread_sigmask(SIG_SETMASK, nullptr, &mask);
    itimerval timer = {};
    getitimer(ITIMER_REAL, &timer);
    state << "\nblocked " << sigismember(&mask, SIGUSR2) << " alarm " << (timer.it_value.tv_sec != 0);
    return state.str();
}

std::vector<Spoiling> spoilings()
{
    return {
        {"C locale", [] { std::setlocale(LC_ALL, "C"); }},
        {"the thread's own locale", [] { uselocale(newlocale(LC_ALL_MASK, "C", nullptr)); }},
        {"C++ locale", [] { std::locale::global(std::locale(std::locale(), new DecimalComma)); }},
        {"file creation mask", [] { umask(0123); }},
        {"working folder that is gone", [] { QDir::setCurrent(QTemporaryDir().path()); }},
        {"rounding mode", [] { std::fesetround(FE_UPWARD); }},
        {"denormals flushed to zero", [] { _MM_SET_FLUSH_ZERO_MODE(_MM_FLUSH_ZERO_ON); }},
        {"handler of a fault", [] { std::signal(SIGSEGV, [](int) {}); }},
        {"ignored signal", [] { std::signal(SIGUSR1, SIG_IGN); }},
        {"signal mask", blockUserSignal},
        {"alarm", [] { alarm(1000); }},
    };
}
