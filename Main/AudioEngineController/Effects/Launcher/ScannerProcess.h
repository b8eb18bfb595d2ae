#pragma once

#include <QByteArray>
#include <QString>
#include <QStringList>

#include <chrono>
#include <memory>

class ScannerChild;

/// One run of the scanner program, in a process group of its own, so that a terminal's Ctrl-C reaches it only
/// through us. It never outlives this object, nor this process.
///
/// Used on one thread, which must live as long as the object does.
class ScannerProcess {
public:
    ScannerProcess();
    /// Ends the scanner if it still runs.
    ~ScannerProcess();
    ScannerProcess(const ScannerProcess &) = delete;
    ScannerProcess &operator=(const ScannerProcess &) = delete;

    /// Sets a variable of the scanner's environment, before it is started.
    void setEnvironment(const QString &variable, const QString &value);
    void setEnvironment(const char *variable, int value);
    /// Starts the program with the system's environment. False when it does not start in time.
    bool start(const QString &program, const QStringList &arguments, std::chrono::milliseconds timeout);
    /// Waits for the end; false when it did not come in time. A process that never started never ends.
    bool waitForFinished(std::chrono::milliseconds timeout);
    /// Writes to the scanner's standard input; false when it takes nothing any more.
    bool write(const QByteArray &bytes);
    /// Asks the scanner to end, which blames no plug-in; by force when it does not in time.
    void end();
    /// Ends the scanner at once, in the middle of what it does.
    void kill();

    /// Process error number (QProcess::ProcessError) and the system's words for it, after a start that
    /// failed.
    int errorCode() const;
    QString errorText() const;
    /// Whether something from outside its own code ended the process: a signal, an unhandled fault.
    bool hasCrashed() const;
    /// Exit code of a process that ended by itself; of one that crashed, the signal (POSIX) or status code.
    int exitCode() const;
    /// What it printed since the last call, at most the last few lines of it.
    QString takeOutput();

private:
    std::unique_ptr<ScannerChild> m_child;
    bool m_started = false;
    QByteArray m_output; ///< the end of what it printed
};
