#include "Workstation/Library/ScanPlace.h"

#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"

#include <QDeadlineTimer>
#include <QDir>
#include <QFileInfo>
#include <QThread>

namespace {

/// False when a scanner goes on.
bool waitForScanner(const QString &effectsFolder)
{
    constexpr int kPatience = 5000; // ms; a scanner's own patience with a plug-in is two seconds
    const QDeadlineTimer deadline(kPatience);
    while (ScanLock::isScannerAtWork(effectsFolder)) {
        if (deadline.hasExpired())
            return false;
        QThread::msleep(50);
    }
    return true;
}

/// The topmost of the folders that have to be made for a path; empty when it is there.
QString firstMissing(const QString &path)
{
    QString missing;
    for (QFileInfo folder(path); !folder.exists() && folder.filePath() != folder.path();
         folder.setFile(folder.path()))
        missing = folder.filePath();
    return missing;
}

} // namespace

ScanPlace::ScanPlace(const QString &effectsFolder)
    : m_effectsFolder(effectsFolder)
    , m_made(firstMissing(effectsFolder))
{
    if (!QDir().mkpath(effectsFolder)) {
        m_reason = QStringLiteral("cannot make the folder %1").arg(effectsFolder);
        return;
    }
    m_workstation = std::make_unique<ScanLock>(effectsFolder, ScanLock::Role::Workstation);
    isHeld(*m_workstation);
}

/// Whether somebody else is at work; then with the reason.
bool ScanPlace::isHeld(const ScanLock &lock)
{
    if (lock.isHeldByOther() || !waitForScanner(m_effectsFolder))
        m_reason = QStringLiteral("another scan is at work on %1 (%2)")
                       .arg(m_effectsFolder, ScanLock::holder(m_effectsFolder));
    return !m_reason.isEmpty();
}

bool ScanPlace::keepScannersAway()
{
    m_scanner = std::make_unique<ScanLock>(m_effectsFolder, ScanLock::Role::Scanner);
    return !isHeld(*m_scanner);
}

bool ScanPlace::writeList(const QStringList &folders)
{
    const QString list = m_effectsFolder + QLatin1String(kScanListFile);
    if (const FileResult written = WriteScanList(list, folders); !written)
        m_reason = QStringLiteral("cannot write the scan list %1: %2").arg(list, written.reason);
    return m_reason.isEmpty();
}

void ScanPlace::removeMade() const
{
    if (!m_made.isEmpty())
        QDir(m_made).removeRecursively();
}
