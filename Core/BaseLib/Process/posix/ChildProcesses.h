#pragma once

#include <QtGlobal>

#include <map>
#include <set>

#include <sys/types.h>

/// The processes whose parent a process is, which is of this user.
std::set<pid_t> childrenOf(pid_t process);

/// Where SIGCHLD is ignored, which a program inherits from whoever started it, children vanish and take their
/// exit status along. This changes that.
void keepEndedChildren();

/// The number of the worker that a process is or descends from; 0 when it does not tell.
int workerOf(pid_t process);
/// The same and all that they started, as far as they are still its descendants; no more when these are some
/// hundreds.
std::set<pid_t> withDescendants(const std::set<pid_t> &processes);
/// Resident memory of a process in bytes; 0 when the system does not tell.
qint64 residentMemoryOf(pid_t process);

/// The memory of processes that share some: a child shares most of its parent's. The system walks through
/// all pages of a process to tell, so that each look reads as many processes as there is time for.
class SharedMemory {
public:
    /// Resident memory of all these in bytes, what they share counted once. What was not read yet counts as
    /// nothing.
    qint64 of(const std::set<pid_t> &processes);

private:
    std::map<pid_t, qint64> m_shares; ///< what was read of each
    pid_t m_last = 0;                 ///< the one that was read last
};
