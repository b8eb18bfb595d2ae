#include "Core/BaseLib/Process/posix/WorkerStart.h"

#include "Core/BaseLib/Process/WorkerGroup.h"

#include <cerrno>
#include <csignal>
#include <cstring>
#include <vector>

#include <fcntl.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>

namespace {

/// Everything that a new process needs, made before the fork: other threads may hold the allocator's locks.
struct Start {
    int channel;
    int printed;
    int failure; ///< where the reason goes when the program cannot be run
    pid_t parent;
    char **arguments;
    char **environment;
};

/// The new process between fork and exec: only what is safe there. Its descriptors may have any number, also
/// one that another is moved to.
[[noreturn]] void becomeWorker(const Start &start)
{
    setsid();
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (getppid() != start.parent) // died before the line above
        _exit(1);
    const int failure = fcntl(start.failure, F_DUPFD_CLOEXEC, WorkerChannel::kDescriptor + 1);
    const int channel = fcntl(start.channel, F_DUPFD_CLOEXEC, WorkerChannel::kDescriptor + 1);
    const int null = open("/dev/null", O_RDONLY | O_CLOEXEC);
    if (dup2(null, STDIN_FILENO) >= 0 && dup2(start.printed, STDOUT_FILENO) >= 0 &&
        dup2(start.printed, STDERR_FILENO) >= 0 && dup2(channel, WorkerChannel::kDescriptor) >= 0) {
        close_range(WorkerChannel::kDescriptor + 1, ~0U, CLOSE_RANGE_CLOEXEC);
        sigset_t none;
        sigemptyset(&none);
        pthread_sigmask(SIG_SETMASK, &none, nullptr);
        for (const int asking : {SIGTERM, SIGINT, SIGHUP}) // the one who started us is asked as well
            std::signal(asking, SIG_IGN);
        execve(start.arguments[0], start.arguments, start.environment);
    }
    const int error = errno;
    [[maybe_unused]] const ssize_t count = ::write(failure, &error, sizeof error);
    _exit(127);
}

/// Waits until a new process runs its program; otherwise the error that kept it from that.
int startError(Descriptor failure)
{
    int error = 0;
    ssize_t count = -1;
    do
        count = ::read(failure.number(), &error, sizeof error);
    while (count < 0 && errno == EINTR);
    return count == sizeof error ? error : 0;
}

/// This process's variables, with the mark of a worker in place of the one that it has itself.
std::vector<char *> environmentWith(QByteArray &mark)
{
    const std::size_t nameSize = std::strcspn(mark.constData(), "=") + 1;
    std::vector<char *> environment{mark.data()};
    for (char **entry = environ; *entry; ++entry)
        if (std::strncmp(*entry, mark.constData(), nameSize) != 0)
            environment.push_back(*entry);
    environment.push_back(nullptr);
    return environment;
}

} // namespace

StartedWorker startWorker(const QByteArray &program, const QList<QByteArray> &arguments, int number)
{
    int channel[2];
    int printed[2];
    int failure[2];
    StartedWorker worker;
    const auto failed = [](int error) {
        StartedWorker none;
        none.error = error;
        return none;
    };
    if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, channel) != 0)
        return failed(errno);
    worker.channel = Descriptor(channel[0]);
    const Descriptor theirChannel(channel[1]);
    if (pipe2(printed, O_CLOEXEC) != 0)
        return failed(errno);
    worker.printed = Descriptor(printed[0]);
    const Descriptor theirOutput(printed[1]);
    if (pipe2(failure, O_CLOEXEC) != 0)
        return failed(errno);
    Descriptor ourFailure(failure[0]);
    Descriptor theirFailure(failure[1]);
    fcntl(channel[0], F_SETFL, O_NONBLOCK);
    fcntl(printed[0], F_SETFL, O_NONBLOCK);

    QList<QByteArray> texts{program};
    texts += arguments;
    std::vector<char *> argumentTexts;
    for (QByteArray &text : texts)
        argumentTexts.push_back(text.data());
    argumentTexts.push_back(nullptr);
    QByteArray mark = QByteArray(WorkerChannel::kVariable) + '=' + QByteArray::number(number);
    std::vector<char *> environment = environmentWith(mark);

    const Start start{channel[1], printed[1], failure[1], getpid(), argumentTexts.data(), environment.data()};
    worker.process = fork();
    if (worker.process == 0)
        becomeWorker(start);
    if (worker.process < 0)
        return failed(errno);
    theirFailure.close();
    if (const int error = startError(std::move(ourFailure)); error != 0) {
        waitpid(worker.process, nullptr, 0);
        return failed(error);
    }
    return worker;
}

void openStandardDescriptors()
{
    for (int number = STDIN_FILENO; number <= STDERR_FILENO; ++number)
        if (fcntl(number, F_GETFD) < 0)
            open("/dev/null", O_RDWR); // takes the lowest free number
}
