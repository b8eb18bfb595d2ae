#pragma once

#include "Main/AudioEngineController/Effects/Protocol/ScanLock.h"

#include <QString>
#include <QStringList>

#include <memory>

/// The Effects folder that this process scans into, or changes: made where it is not there, and kept from
/// other workstations for as long as the object lives.
class ScanPlace {
public:
    /// Waits up to five seconds for a scanner whose workstation was killed: its markers must not be taken for
    /// crashes.
    explicit ScanPlace(const QString &effectsFolder);

    /// Why the folder cannot be used; empty when it can. One sentence without a full stop.
    const QString &reason() const { return m_reason; }
    /// False when the folder cannot be used.
    explicit operator bool() const { return m_reason.isEmpty(); }

    /// Keeps scanners away as well, for what is done here in place of one; false, with the reason, when one
    /// is at work: a workstation of another kind may have started it.
    bool keepScannersAway();
    /// Writes the scan list; false, with the reason, when it cannot: an old list would be scanned.
    bool writeList(const QStringList &folders);

    /// Removes the folders that were made for it, with what lies in them: nothing came of it.
    void removeMade() const;

private:
    bool isHeld(const ScanLock &lock);

    QString m_effectsFolder;
    QString m_made; ///< the topmost folder that was not there; empty: all were
    std::unique_ptr<ScanLock> m_workstation;
    std::unique_ptr<ScanLock> m_scanner;
    QString m_reason;
};
