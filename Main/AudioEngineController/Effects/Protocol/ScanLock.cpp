#include "Main/AudioEngineController/Effects/Protocol/ScanLock.h"

#include "Core/BaseLib/Files/NativeFile.h"
#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/ThreadCount.h"

#include <QCoreApplication>
#include <QCryptographicHash>
#include <QDir>
#include <QFileInfo>
#include <QSysInfo>

namespace {

/// A lock this old, in ms, that no process holds open is not respected even when the file does not tell whose
/// it was.
constexpr int kStaleAfter = 60000;

QString lockPath(const QString &effectsFolder, ScanLock::Role role)
{
    const QFileInfo folder(effectsFolder);
    const QString known = folder.exists() ? folder.canonicalFilePath() : folder.absoluteFilePath();
    const QByteArray hash =
        QCryptographicHash::hash(pathKey(known).toUtf8(), QCryptographicHash::Sha1).toHex();
    const QString name =
        role == ScanLock::Role::Scanner ? QStringLiteral("FxProbe") : QStringLiteral("fxscan");
    return QStringLiteral("%1/%2-%3.lock").arg(QDir::tempPath(), name, QString::fromLatin1(hash));
}

/// Whether the process that made the lock has died, though nobody but another user, or a process that a
/// plug-in started in the dead one, could take it away.
bool isLeftBehind(const QLockFile &file)
{
    qint64 process = 0;
    QString host;
    QString application;
    return file.getLockInfo(&process, &host, &application) && host == QSysInfo::machineHostName() &&
           !isProcessRunning(process);
}

} // namespace

ScanLock::ScanLock(const QString &effectsFolder, Role role)
    : m_file(lockPath(effectsFolder, role))
{
    m_file.setStaleLockTime(kStaleAfter);
    if (m_file.tryLock())
        return;
    // A lock that no process holds open cannot be somebody's, also when a process has the number that it
    // states: numbers are used again, and soon by the next scanner. One that is held open cannot be removed.
    if (m_file.removeStaleLockFile() && m_file.tryLock())
        return;
    m_heldByOther = m_file.error() == QLockFile::LockFailedError && !isLeftBehind(m_file);
    if (!m_heldByOther)
        DebugLog(L"Cannot make the lock %ls; scanning without it", lockPath(effectsFolder, role));
}

bool ScanLock::isScannerAtWork(const QString &effectsFolder)
{
    QLockFile file(lockPath(effectsFolder, Role::Scanner));
    file.setStaleLockTime(kStaleAfter);
    qint64 process = 0;
    QString host;
    QString application;
    return file.getLockInfo(&process, &host, &application) && process != QCoreApplication::applicationPid() &&
           !file.removeStaleLockFile() && !isLeftBehind(file);
}

QString ScanLock::holder(const QString &effectsFolder)
{
    for (const Role role : {Role::Scanner, Role::Workstation}) {
        qint64 process = 0;
        QString host;
        QString application;
        const QLockFile file(lockPath(effectsFolder, role));
        if (file.getLockInfo(&process, &host, &application))
            return QStringLiteral("%1, process %2").arg(application).arg(process);
    }
    return QString();
}
