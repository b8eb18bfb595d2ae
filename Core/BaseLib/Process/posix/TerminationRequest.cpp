#include "Core/BaseLib/Process/TerminationRequest.h"

#include <csignal>
#include <cstdlib>
#include <ctime>

#include <semaphore.h>
#include <unistd.h>

namespace {

/// Posting a semaphore is one of the few things that a signal handler may do (signal-safety(7)).
sem_t *requests()
{
    static sem_t *semaphore = [] {
        static sem_t storage;
        sem_init(&storage, 0, 0);
        return &storage;
    }();
    return semaphore;
}

void onSignal(int) { TerminationSignal::raise(); }

/// The process whose helper this one is, or 0; set before anybody waits.
pid_t s_parent = 0;

/// Only the real parent counts: a debugger or a script in between may end at any time.
void watchParent()
{
    const char *const text = std::getenv(TerminationSignal::kParentVariable);
    const pid_t named = text ? static_cast<pid_t>(std::strtol(text, nullptr, 10)) : 0;
    s_parent = named == getppid() ? named : 0;
}

bool isParentGone() { return s_parent != 0 && getppid() != s_parent; }

timespec deadlineIn(std::chrono::milliseconds timeout)
{
    timespec deadline = {};
    clock_gettime(CLOCK_MONOTONIC, &deadline);
    const auto nanoseconds = deadline.tv_nsec + std::chrono::nanoseconds(timeout).count();
    deadline.tv_sec += nanoseconds / 1000000000;
    deadline.tv_nsec = nanoseconds % 1000000000;
    return deadline;
}

} // namespace

void TerminationSignal::install()
{
    requests(); // made before a handler can run
    watchParent();
    for (const int number : {SIGTERM, SIGINT, SIGHUP}) {
        struct sigaction action = {};
        // Whoever started us with a signal ignored (nohup) wants it ignored.
        if (sigaction(number, nullptr, &action) == 0 && action.sa_handler == SIG_IGN)
            continue;
        action = {};
        action.sa_handler = onSignal;
        action.sa_flags = SA_RESTART;
        sigemptyset(&action.sa_mask);
        sigaction(number, &action, nullptr);
    }
}

void TerminationSignal::raise() { sem_post(requests()); }

bool TerminationSignal::wait(std::chrono::milliseconds timeout)
{
    const timespec deadline = deadlineIn(timeout);
    // The system could signal the parent's end, but a plug-in may have taken that signal for itself.
    return sem_clockwait(requests(), CLOCK_MONOTONIC, &deadline) == 0 || isParentGone();
}
