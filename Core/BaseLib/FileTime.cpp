#include "Core/BaseLib/FileTime.h"

#include "Core/BaseLib/NativeFile.h"

#include <QDateTime>
#include <QFileInfo>

QString fileTimeText(const QString &path)
{
    const QFileInfo file(path);
    if (!file.exists())
        return QString();
    QDateTime modified = file.lastModified();
    // Qt takes the first second of 1970 for no time at all; files from package systems that keep no dates
    // carry it.
    if (!modified.isValid())
        modified = QDateTime::fromMSecsSinceEpoch(0);
    return modified.toString(QStringLiteral("yyyy-MM-dd hh:mm"));
}

FileStamp fileStamp(const QString &path)
{
    const QFileInfo file(path);
    if (!file.exists())
        return {};
    return {modifiedNanoseconds(path), file.size()};
}
