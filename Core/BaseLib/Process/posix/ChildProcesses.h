#pragma once

#include <QtGlobal>

#include <set>

#include <sys/types.h>

/// The processes whose parent a process is, which is of this user.
std::set<pid_t> childrenOf(pid_t process);

/// Where SIGCHLD is ignored, which a program inherits from whoever started it, children vanish and take their
/// exit status along. This changes that.
void keepEndedChildren();

/// The number of the worker that a process is or descends from; 0 when it does not tell.
int workerOf(pid_t process);
/// The same and all that they started, as far as they are still its descendants; not for ever where they
/// start others without end.
std::set<pid_t> withDescendants(const std::set<pid_t> &processes);
/// Resident memory of a process in bytes; 0 when the system does not tell.
qint64 residentMemoryOf(pid_t process);
/// The same, with what it shares with others divided among them: a child shares most of its parent's.
qint64 shareOfMemory(pid_t process);
