#include "Tests/Fixtures/FixturePlatform.h"

#include <csignal>
#include <cstdlib>

#include <dlfcn.h>
#include <fcntl.h>
#include <pthread.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

char *volatile repairedPage = nullptr;
const std::size_t kPageSize = 4096;

/// Makes the page writable. At another address the default action is due: it comes when the instruction runs
/// again.
void repairPage(int, siginfo_t *information, void *)
{
    if (information->si_addr == repairedPage)
        mprotect(repairedPage, kPageSize, PROT_READ | PROT_WRITE);
    else
        std::signal(SIGSEGV, SIG_DFL);
}

} // namespace

std::string modulePath()
{
    Dl_info info = {};
    dladdr(reinterpret_cast<void *>(&modulePath), &info);
    return info.dli_fname ? info.dli_fname : "";
}

bool appendToFile(const std::string &path, const std::string &text)
{
    const int file = open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, 0666);
    if (file < 0)
        return false;
    const ssize_t written = write(file, text.data(), text.size());
    close(file);
    return written == static_cast<ssize_t>(text.size());
}

void endProcess(int exitCode) { _exit(exitCode); }

void killProcess() { kill(getpid(), SIGKILL); }

void endThread() { pthread_exit(nullptr); }

void setFileMask(int mask) { umask(static_cast<mode_t>(mask)); }

bool repairOwnViolation(const std::string &)
{
    void *page = mmap(nullptr, kPageSize, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (page == MAP_FAILED)
        return false;
    struct sigaction own = {};
    own.sa_sigaction = repairPage;
    own.sa_flags = SA_SIGINFO;
    repairedPage = static_cast<char *>(page);
    sigaction(SIGSEGV, &own, nullptr);
    *static_cast<volatile char *>(page) = 1;
    return munmap(page, kPageSize) == 0;
}

bool startAlarm(const std::string &seconds)
{
    const long count = std::strtol(seconds.c_str(), nullptr, 10);
    alarm(static_cast<unsigned>(count));
    return count > 0;
}
