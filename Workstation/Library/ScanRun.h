#pragma once

#include "Workstation/Summary/ScanAccount.h"

#include <QString>

#include <set>

class PluginHost;

/// One scan as a user means it: has the registry's launcher run scanners until everything is probed. Whoever
/// shows a scan's progress derives from it. Used on one thread.
class ScanRun {
public:
    /// `report` is the file that the scanners report to; it is followed from its present end on.
    ScanRun(PluginHost &registry, const QString &report);
    virtual ~ScanRun() = default;
    ScanRun(const ScanRun &) = delete;
    ScanRun &operator=(const ScanRun &) = delete;

    /// Scans. False when the scan did not come to its end; `reason` then says why.
    bool run();
    /// One sentence without a full stop; empty for a scan that came to its end.
    const QString &reason() const { return m_reason; }
    /// What the scanners reported.
    const ScanAccount &account() const { return m_account; }

protected:
    /// Called all the while: waits for a moment. May cancel the scan.
    virtual void wait() = 0;
    /// Called after each wait: shows how the scan gets on.
    virtual void show(ScanAccount &account) = 0;
    /// A plug-in ended a scanner.
    virtual void culpritFound(const ScanCulprit & /*culprit*/) {}
    /// Scans once, until no scanner is at work any more.
    virtual void scanOnce();

    /// Asks the scan to end.
    void cancel();
    bool isCancelled() const { return m_cancelled; }
    PluginHost &registry() const { return m_registry; }
    /// Waits, takes in what was reported meanwhile, and shows it.
    void look();

private:
    bool isDoneAfterOnce();
    void takeEnds();
    void takeEnd(const ScannerRunEnd &end);

    PluginHost &m_registry;
    ScanAccount m_account;
    std::size_t m_ends = 0;       ///< of scanners, in the present launch
    std::set<PluginKey> m_blamed; ///< in the whole scan
    bool m_hasNewCulprit = false; ///< in the present launch
    bool m_cancelled = false;
    QString m_reason;
};
