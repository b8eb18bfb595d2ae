#pragma once

#include "Tests/Support/ChildProcess.h"

#include <QDeadlineTimer>
#include <QProcessEnvironment>
#include <QString>
#include <QStringList>

#include <functional>

class TestFolder;

/// How a run of the scanner ended. A run that never started counts as failed in each field.
struct ScannerOutcome {
    bool started = false;
    bool crashed = false; ///< ended by a signal, or by a sanitizer in place of one
    int exitCode = -1;    ///< -1 when a signal ended it
    QByteArray standardOutput;
    QByteArray standardError;
    QString log; ///< what this run wrote to its debug log

    /// Ended by itself with exit code 0.
    bool succeeded() const { return started && !crashed && exitCode == 0; }
};

/// One run of the real scanner, or of another program, in a process of its own, without a screen. The test
/// fails when the program cannot be started, overruns its time limit, calls a fixture wrongly or is found
/// faulty by a sanitizer. A run that was not waited for is killed with this object.
class ScannerRun {
public:
    ScannerRun(const QString &program, const TestFolder &folder);
    ~ScannerRun();
    ScannerRun(const ScannerRun &) = delete;
    ScannerRun &operator=(const ScannerRun &) = delete;

    /// The scan list of the folder, unless set.
    void setArguments(const QStringList &arguments) { m_arguments = arguments; }
    void setEnvironment(const QString &name, const QString &value) { m_environment.insert(name, value); }
    void removeEnvironment(const QString &name) { m_environment.remove(name); }
    void setWorkingFolder(const QString &folder) { m_process.setWorkingDirectory(folder); }

    bool start();
    /// Waits in a started run until the condition holds; false when the run or its time limit ended before.
    bool waitUntil(const std::function<bool()> &condition);
    /// What a started run has printed so far.
    QByteArray printed() { return m_process.peek(m_process.bytesAvailable()); }
    /// The processes that a started run has started.
    std::vector<qint64> children() const { return childrenOf(m_process.processId()); }
    /// Asks the program to end (SIGTERM).
    void requestTermination(const TerminationWay &way = terminationWays().front());
    /// Ends the program by force (SIGKILL).
    void kill() { m_process.kill(); }
    /// Waits for the end of a started run.
    const ScannerOutcome &wait();
    /// start() and wait() in one.
    const ScannerOutcome &run() { return start() ? wait() : m_outcome; }

private:
    const TestFolder &m_folder;
    QString m_program;
    QStringList m_arguments;
    QProcessEnvironment m_environment;
    QDeadlineTimer m_deadline;
    ChildProcess m_process;
    ScannerOutcome m_outcome;
};
