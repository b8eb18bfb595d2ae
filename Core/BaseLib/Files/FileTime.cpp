#include "Core/BaseLib/Files/FileTime.h"

#include "Core/BaseLib/Files/NativeFile.h"

#include <QDateTime>
#include <QFileInfo>

#include <cstdio>

namespace {

QString textOf(const CalendarTime &time)
{
    char text[64];
    std::snprintf(text, sizeof text, "%04d-%02d-%02d %02d:%02d", time.year, time.month, time.day, time.hour,
                  time.minute);
    return QString::fromLatin1(text);
}

} // namespace

QString fileTimeText(const QString &path)
{
    const std::optional<FileStatus> status = fileStatus(path);
    return status ? textOf(status->modified) : QString();
}

QString regularFileTimeText(const QString &path)
{
    const std::optional<FileStatus> status = fileStatus(path);
    return status && status->isRegular ? textOf(status->modified) : QString();
}

FileStamp fileStamp(const QString &path)
{
    const QFileInfo file(path);
    if (!file.exists())
        return {};
    return {modifiedNanoseconds(path), file.size()};
}

void touchFile(const QString &path)
{
    QFile file(path);
    if (file.open(QIODevice::ReadWrite | QIODevice::ExistingOnly))
        file.setFileTime(QDateTime::currentDateTimeUtc(), QFileDevice::FileModificationTime);
}
