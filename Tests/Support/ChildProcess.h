#pragma once

#include <QProcess>

#include <ostream>
#include <vector>

/// A process that does not outlive the test program, also when that is killed for taking too long.
class ChildProcess : public QProcess {
public:
    ChildProcess();

protected:
    void setupChildProcess() override;
};

/// The processes that a process started and that run, not what they started in turn.
std::vector<qint64> childrenOf(qint64 process);

/// A way in which a process is asked to end.
struct TerminationWay {
    const char *name;
    int number; ///< the system's own

    friend void PrintTo(const TerminationWay &way, std::ostream *out) { *out << way.name; }
};
/// The system's ways to ask a process to end; the first one as the end of the user's session does.
const std::vector<TerminationWay> &terminationWays();
void requestTermination(QProcess &process, const TerminationWay &way = terminationWays().front());
