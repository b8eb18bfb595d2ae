#pragma once

#include <set>

#include <sys/types.h>

/// The processes whose parent a process is, which is of this user.
std::set<pid_t> childrenOf(pid_t process);

/// Where SIGCHLD is ignored, which a program inherits from whoever started it, children vanish and take their
/// exit status along. This changes that.
void keepEndedChildren();

/// The number of the worker that a process is or descends from; 0 when it does not tell.
int workerOf(pid_t process);
