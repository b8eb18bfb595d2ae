#include "Tests/Fixtures/FixturePlatform.h"

#include <csignal>
#include <cstdlib>

#include <dlfcn.h>
#include <fcntl.h>
#include <pthread.h>
#include <sys/stat.h>
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

void setFileMask(int mask) { umask(static_cast<mode_t>(mask)); }

bool startAlarm(const std::string &seconds)
{
    const long count = std::strtol(seconds.c_str(), nullptr, 10);
    alarm(static_cast<unsigned>(count));
    return count > 0;
}
