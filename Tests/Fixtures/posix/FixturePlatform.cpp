#include "Tests/Fixtures/FixturePlatform.h"

#include <csignal>
#include <cstdlib>

#include <dlfcn.h>
#include <fcntl.h>
#include <pthread.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

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

bool leaveChild(const std::string &file)
{
    const pid_t child = fork();
    if (child != 0)
        return child > 0 && appendToFile(file, std::to_string(child) + '\n');
    for (;;)
        pause();
}

bool leaveDaemon(const std::string &file)
{
    const pid_t child = fork();
    if (child != 0)
        return waitpid(child, nullptr, 0) == child;
    setsid();
    _exit(leaveChild(file) ? 0 : 1);
}

bool feedChild(const std::string &mebibytes)
{
    const pid_t child = fork();
    if (child != 0)
        return child > 0;
    const std::size_t size = std::strtoul(mebibytes.c_str(), nullptr, 10) << 20;
    mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS | MAP_POPULATE, -1, 0);
    for (;;)
        pause();
}

bool outliveParent() { return prctl(PR_SET_PDEATHSIG, 0) == 0; }

bool killParent() { return kill(-getpgid(getppid()), SIGKILL) == 0; }

bool writeEverywhere()
{
    for (int number = 3; number < 256; ++number)
        [[maybe_unused]] const ssize_t count = write(number, "garbage garbage ", 16);
    return true;
}

bool closeEverything() { return close_range(0, ~0U, 0) == 0; }

bool hasTerminal() { return open("/dev/tty", O_RDWR) >= 0; }

void setFileMask(int mask) { umask(static_cast<mode_t>(mask)); }

bool startAlarm(const std::string &seconds)
{
    const long count = std::strtol(seconds.c_str(), nullptr, 10);
    alarm(static_cast<unsigned>(count));
    return count > 0;
}
