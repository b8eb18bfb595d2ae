#include "Core/BaseLib/Files/TextFile.h"

#include "Core/BaseLib/Files/NativeFile.h"

#include <QFile>
#include <QFileInfo>

namespace {

/// What is written at once needs no buffer, and one that cannot be emptied keeps a file from being removed.
constexpr QIODevice::OpenMode kWhole = QIODevice::WriteOnly | QIODevice::Truncate | QIODevice::Unbuffered;

FileResult writeAll(QFile &file, const QByteArray &content, Durability durability)
{
    // A disk that fills up accepts a part first; only the next attempt gives the reason.
    for (qint64 written = 0; written < content.size();) {
        const qint64 taken = file.write(content.constData() + written, content.size() - written);
        if (taken <= 0)
            return {file.errorString()};
        written += taken;
    }
    if (durability == Durability::Synced)
        syncToDisk(file.handle());
    file.close();
    return file.error() == QFile::NoError ? FileResult{} : FileResult{file.errorString()};
}

/// Writes over the only copy. Where the content does not fit, what was there stays: only space that is there
/// already is written over.
FileResult writeDirectly(const QString &path, const QByteArray &content, Durability durability)
{
    QFile file(path);
    const QFileInfo existing(path);
    if (!existing.isFile()) {
        const bool isOpen = file.open(kWhole);
        return isOpen ? writeAll(file, content, durability) : FileResult{file.errorString()};
    }
    const int size = static_cast<int>(existing.size());
    if (content.size() > size) {
        if (!file.open(QIODevice::Append | QIODevice::Unbuffered))
            return {file.errorString()};
        FileResult grown = writeAll(file, content.mid(size), Durability::Buffered);
        if (!grown) {
            file.close();
            QFile::resize(path, size);
            return grown;
        }
    }
    if (!file.open(QIODevice::ReadWrite | QIODevice::Unbuffered))
        return {file.errorString()};
    FileResult result = writeAll(file, content, durability);
    if (result && content.size() < size && !QFile::resize(path, content.size()))
        result.reason = QStringLiteral("it could not be shortened");
    return result;
}

} // namespace

FileResult replaceFile(const QString &path, const QByteArray &content, Durability durability)
{
    const QFileInfo existing(path);
    const bool exists = existing.exists();
    // A file reached through a link is replaced where it lies; the link stays.
    const QString target = exists && existing.isSymLink() ? existing.canonicalFilePath() : path;
    // A device or a pipe is written to; renaming a file over it would take it away.
    if (exists && !existing.isFile())
        return writeDirectly(target, content, durability);
    if (exists) {
        if (!existing.isWritable())
            return {QStringLiteral("it is write-protected")};
        QFile probe(target);
        if (!probe.open(QIODevice::WriteOnly | QIODevice::Append))
            return {probe.errorString()};
    }
    QFile temporary(target + QStringLiteral(".tmp"));
    if (!temporary.open(kWhole))
        return writeDirectly(target, content, durability);
    if (exists)
        temporary.setPermissions(existing.permissions());
    FileResult result = writeAll(temporary, content, durability);
    if (result) {
        result = renameOver(temporary.fileName(), target);
        if (result)
            return result;
    }
    temporary.remove();
    return result;
}

FileResult readWholeFile(const QString &path, QByteArray &content)
{
    QFile file(path);
    // A pipe or a device may have no end.
    const QFileInfo info(path);
    if (info.exists() && !info.isFile())
        return {QStringLiteral("it is not a regular file")};
    if (!file.open(QIODevice::ReadOnly))
        return {file.errorString()};
    content = file.readAll();
    return file.error() == QFile::NoError ? FileResult{} : FileResult{file.errorString()};
}
