#include "Core/BaseLib/FileTime.h"

#include "Core/BaseLib/NativeFile.h"

#include <QDateTime>
#include <QFileInfo>

QString fileTimeText(const QString &path)
{
    const QFileInfo file(path);
    return file.exists() ? file.lastModified().toString(QStringLiteral("yyyy-MM-dd hh:mm")) : QString();
}

FileStamp fileStamp(const QString &path)
{
    const QFileInfo file(path);
    if (!file.exists())
        return {};
    return {modifiedNanoseconds(path), file.size()};
}
