#pragma once

#include <QLockFile>
#include <QString>

/// Keeps a second scanner away from an Effects folder, for as long as the object lives. The lock lies in the
/// system's temporary folder, so that the Effects folder holds nothing that its other readers do not know. A
/// lock left by a process that died counts for nothing.
class ScanLock {
public:
    explicit ScanLock(const QString &effectsFolder);

    /// True when another process scans the folder. Where no lock can be made at all, nobody else is assumed.
    bool isHeldByOther() const { return m_heldByOther; }

private:
    QLockFile m_file;
    bool m_heldByOther = false;
};
