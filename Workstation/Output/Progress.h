#pragma once

#include "Workstation/Summary/ScanAccount.h"

#include <QElapsedTimer>
#include <QString>

/// Shows how a scan gets on, on the error output: on a terminal one line that lives, else a line per file.
class Progress {
public:
    /// `limit`: the seconds that one plug-in may take; 0: any.
    Progress(bool isQuiet, int limit);
    /// Takes the live line away.
    ~Progress() { end(); }
    Progress(const Progress &) = delete;
    Progress &operator=(const Progress &) = delete;

    /// Shows what is being probed and how many files are done, and with `hasKeys` what a user can press.
    void show(ScanAccount &account, bool hasKeys = false);
    /// A line that stays.
    void say(const QString &text);
    /// Takes the live line away: what comes after it begins a line.
    void end();

private:
    void showLines(ScanAccount &account);
    void showLine(const ScanAccount &account, const PluginKey &key, bool hasKeys);
    void showLooking(const QString &folder);
    QString timeText(double milliseconds, const QString &keys = QString()) const;
    void showText(const QString &given);

    bool m_isQuiet;
    bool m_isTerminal;
    int m_limit;
    QString m_line;    ///< as it stands on the terminal
    QString m_looking; ///< the folder that it was about last
    QElapsedTimer m_since;
};
