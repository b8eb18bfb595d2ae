#include "Core/BaseLib/Process/WorkerGroup.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <system_error>
#include <thread>

#include <fcntl.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <unistd.h>

namespace {

constexpr int kBlock = 65536;
constexpr useconds_t kLook = 250000;

/// This process, and what its plug-ins started in its group.
void endGroup(int) { ::kill(-getpid(), SIGKILL); }

/// Ends this process and its group when the scanner has ended. The system sends a signal then, which does not
/// reach a worker whose plug-in has switched it off, or handles it itself.
void watchScanner()
{
    sigset_t all;
    sigset_t before;
    sigfillset(&all);
    pthread_sigmask(SIG_SETMASK, &all, &before); // signals are the plug-ins' business
    try {
        std::thread([scanner = getppid()] {
            while (getppid() == scanner)
                usleep(kLook);
            ::kill(-getpid(), SIGKILL);
        }).detach();
        // So far it is SIGKILL, which nothing escapes but what plug-ins started.
        std::signal(SIGRTMAX, endGroup);
        prctl(PR_SET_PDEATHSIG, SIGRTMAX);
    } catch (const std::system_error &) { // the signal is there
    }
    pthread_sigmask(SIG_SETMASK, &before, nullptr);
}

} // namespace

bool WorkerChannel::isThere()
{
    int type = 0;
    socklen_t size = sizeof type;
    return qEnvironmentVariableIsSet(kVariable) &&
           getsockopt(kDescriptor, SOL_SOCKET, SO_TYPE, &type, &size) == 0;
}

WorkerChannel::WorkerChannel()
    // Away from the low numbers, which plug-ins close and open by habit.
    : m_handle(fcntl(kDescriptor, F_DUPFD_CLOEXEC, 100))
{
    if (m_handle >= 0)
        ::close(kDescriptor);
    else
        m_handle = kDescriptor;
    watchScanner();
    // The variable stays: by it the scanner tells whose child a process is, wherever that has gone.
}

WorkerChannel::~WorkerChannel() { ::close(static_cast<int>(m_handle)); }

QByteArray WorkerChannel::read()
{
    QByteArray bytes(kBlock, Qt::Uninitialized);
    ssize_t count = -1;
    do
        count = ::read(static_cast<int>(m_handle), bytes.data(), static_cast<std::size_t>(bytes.size()));
    while (count < 0 && errno == EINTR);
    return bytes.left(std::max<int>(0, static_cast<int>(count)));
}

bool WorkerChannel::write(const QByteArray &bytes)
{
    int done = 0;
    while (done < bytes.size()) {
        const ssize_t count = ::send(static_cast<int>(m_handle), bytes.constData() + done,
                                     static_cast<std::size_t>(bytes.size() - done), MSG_NOSIGNAL);
        if (count < 0 && errno != EINTR)
            return false;
        done += std::max<int>(0, static_cast<int>(count));
    }
    return true;
}
