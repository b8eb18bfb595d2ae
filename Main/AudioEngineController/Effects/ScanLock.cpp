#include "Main/AudioEngineController/Effects/ScanLock.h"

#include "Core/BaseLib/DebugLog.h"

#include <QCryptographicHash>
#include <QDir>
#include <QFileInfo>

namespace {

/// A lock this old, in ms, that no process holds open is not respected even when the file does not tell whose
/// it was.
constexpr int kStaleAfter = 60000;

QString lockPath(const QString &effectsFolder, ScanLock::Role role)
{
    const QFileInfo folder(effectsFolder);
    const QString known = folder.exists() ? folder.canonicalFilePath() : folder.absoluteFilePath();
    const QByteArray hash = QCryptographicHash::hash(known.toUtf8(), QCryptographicHash::Sha1).toHex();
    const QString name =
        role == ScanLock::Role::Scanner ? QStringLiteral("FxProbe") : QStringLiteral("fxscan");
    return QStringLiteral("%1/%2-%3.lock").arg(QDir::tempPath(), name, QString::fromLatin1(hash));
}

} // namespace

ScanLock::ScanLock(const QString &effectsFolder, Role role)
    : m_file(lockPath(effectsFolder, role))
{
    m_file.setStaleLockTime(kStaleAfter);
    if (m_file.tryLock())
        return;
    m_heldByOther = m_file.error() == QLockFile::LockFailedError;
    if (!m_heldByOther)
        DebugLog(L"Cannot make the lock %ls; scanning without it", lockPath(effectsFolder, role));
}
