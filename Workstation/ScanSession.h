#pragma once

#include "Workstation/Options/ScanOptions.h"
#include "Workstation/Output/Progress.h"
#include "Workstation/Output/TerminalKeys.h"
#include "Workstation/Summary/ScanAccount.h"

#include <QElapsedTimer>

#include <set>

class PluginHost;

/// One scan as a user means it: scans through the registry until everything is probed, shows how it gets on,
/// and ends it when somebody asks.
class ScanSession {
public:
    /// `report` is the file that the scanner reports to.
    ScanSession(const ScanOptions &options, PluginHost &registry, const QString &report);

    /// Scans. False when the scan did not come to its end; `reason` then says why.
    bool run();
    const QString &reason() const { return m_reason; }
    const ScanAccount &account() const { return m_account; }

private:
    bool scanOnce();
    void scanHere();
    void waitForLauncher();
    void takeEnds();
    void takeEnd(const ScannerRunEnd &end);
    void cancel();
    void skip();
    void takeKeys();
    void look();
    void endOverdueProbe() const;

    const ScanOptions &m_options;
    PluginHost &m_registry;
    ScanAccount m_account;
    TerminalKeys m_keys;
    Progress m_progress;
    std::size_t m_ends = 0;       ///< of scanners, in the present launch
    std::set<PluginKey> m_blamed; ///< in the whole session
    bool m_hasNewCulprit = false; ///< in the present launch
    bool m_cancelled = false;
    QElapsedTimer m_sinceCancel;
    QString m_reason;
};
