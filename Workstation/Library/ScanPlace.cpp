#include "Workstation/Library/ScanPlace.h"

#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"

#include <QDeadlineTimer>
#include <QDir>
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

} // namespace

ScanPlace::ScanPlace(const QString &effectsFolder)
    : m_effectsFolder(effectsFolder)
{
    if (!QDir().mkpath(effectsFolder)) {
        m_reason = QStringLiteral("cannot make the folder %1").arg(effectsFolder);
        return;
    }
    m_lock = std::make_unique<ScanLock>(effectsFolder, ScanLock::Role::Workstation);
    if (m_lock->isHeldByOther() || !waitForScanner(effectsFolder))
        m_reason = QStringLiteral("another scan is at work on %1 (%2)")
                       .arg(effectsFolder, ScanLock::holder(effectsFolder));
}

bool ScanPlace::writeList(const QStringList &folders)
{
    const QString list = m_effectsFolder + QLatin1String(kScanListFile);
    if (const FileResult written = WriteScanList(list, folders); !written)
        m_reason = QStringLiteral("cannot write the scan list %1: %2").arg(list, written.reason);
    return m_reason.isEmpty();
}
