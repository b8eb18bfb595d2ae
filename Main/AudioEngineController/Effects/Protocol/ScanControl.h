#pragma once

#include <QByteArray>
#include <QSet>
#include <QString>

/// What the workstation asks of a scanner that is at work. Requests come on the scanner's standard input, one
/// JSON object a line, when the environment says so; docs/protocol.md describes them. Used on the thread that
/// scans.
class ScanControl {
public:
    /// The environment variable that has a scanner listen, with the value 1: else its input is nobody's, or
    /// that of a terminal.
    static constexpr char kVariable[] = "FXPROBE_CONTROL";

    /// The process's own, which listens if the environment says so.
    static ScanControl &instance();

    /// Whether somebody asked to pass over a file in this run; a look at what has arrived.
    bool isSkipped(const QString &path);

    /// The line that asks to pass over a file.
    static QByteArray skipLine(const QString &path);

private:
    ScanControl();
    void takeLine(const QByteArray &line);

    const bool m_listens;
    QByteArray m_rest;     ///< of a line that is not complete yet
    QSet<QString> m_skips; ///< paths, by `pathKey`
};
