#pragma once

#include <QProcess>

/// The scanner as a child process, as far as systems differ: it is asked to end when this process ends.
class ScannerChild : public QProcess {
public:
    ScannerChild();

    /// In words, what ended a process that crashed; `code` is what `exitCode()` gave.
    static QString crashText(int code);

protected:
    void setupChildProcess() override;
};
