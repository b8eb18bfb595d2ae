#pragma once

#include "Core/BaseLib/Process/posix/Descriptor.h"

#include <QByteArray>
#include <QList>

#include <sys/types.h>

/// A new worker and our ends of what leads to it, which never wait; or the error that kept it from running.
struct StartedWorker {
    pid_t process = -1;
    Descriptor channel;
    Descriptor printed; ///< its output
    int error = 0;
};

/// Starts a program in a session of its own, with the null device as its input, and returns when it runs. It
/// finds its channel as `WorkerChannel` says, and its number in that one's variable.
StartedWorker startWorker(const QByteArray &program, const QList<QByteArray> &arguments, int number);

/// Opens the null device in place of standard descriptors that are closed: otherwise a pipe or socket gets
/// such a number, and with it what this process prints.
void openStandardDescriptors();
