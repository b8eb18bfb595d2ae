#pragma once

#include <QLockFile>
#include <QString>

/// Keeps a second scanner, or a second workstation, away from an Effects folder, for as long as the object
/// lives. The lock lies in the system's temporary folder, so that the Effects folder holds nothing that its
/// other readers do not know. A lock left by a process that died counts for nothing.
class ScanLock {
public:
    /// A scanner and the workstation that started it are at work on a folder at the same time.
    enum class Role { Scanner, Workstation };

    explicit ScanLock(const QString &effectsFolder, Role role = Role::Scanner);

    /// True when the scanner of another process is at work on the folder now.
    static bool isScannerAtWork(const QString &effectsFolder);

    /// The process that holds a lock on the folder, in words; empty where there is none, or nobody knows.
    static QString holder(const QString &effectsFolder);

    /// True when another process of that role is at work on the folder. Where no lock can be made at all,
    /// nobody else is assumed.
    bool isHeldByOther() const { return m_heldByOther; }

private:
    QLockFile m_file;
    bool m_heldByOther = false;
};
