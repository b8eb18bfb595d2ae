#pragma once

#include <QProcess>

/// The scanner as a child process, as far as systems differ.
class ScannerChild : public QProcess {
public:
    ScannerChild();
    ~ScannerChild() override;

    /// To be called when the process has started: from now on it ends with this process.
    void tieToThisProcess();

    /// In words, what ended a process that crashed; `code` is what `exitCode()` gave.
    static QString crashText(int code);

protected:
    void setupChildProcess() override;

private:
    void *m_job = nullptr; ///< Windows: the job object that holds the process
};
