#pragma once

#include <QProcess>

/// A process that does not outlive the test program, also when that is killed for taking too long.
class ChildProcess : public QProcess {
public:
    ChildProcess();

protected:
    void setupChildProcess() override;
};

/// Asks a process to end, as the end of the user's session does.
void requestTermination(QProcess &process);
/// The number of the signal that ended a crashed process; 0 where there is no such thing.
int endingSignal(const QProcess &process);
