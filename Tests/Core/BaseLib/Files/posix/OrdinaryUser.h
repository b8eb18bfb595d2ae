#pragma once

#include <grp.h>
#include <sys/wait.h>
#include <unistd.h>

inline bool becomeOrdinaryUser()
{
    constexpr uid_t kNobody = 65534;
    return getuid() != 0 || (setgroups(0, nullptr) == 0 && setresgid(kNobody, kNobody, kNobody) == 0 &&
                             setresuid(kNobody, kNobody, kNobody) == 0);
}

/// Runs the body in a child process that permissions apply to: root's child gives up its rights. True when
/// the body answered true.
template <typename Body>
bool trueForOrdinaryUser(const Body &body)
{
    const pid_t child = fork();
    if (child == 0)
        _exit(becomeOrdinaryUser() && body() ? 0 : 1);
    int status = -1;
    return child > 0 && waitpid(child, &status, 0) == child && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}
