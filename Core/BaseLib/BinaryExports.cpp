#include "Core/BaseLib/BinaryExports.h"

#include <QFile>
#include <QFileInfo>

ExportAnswer findExports(const QString &path, const std::vector<QByteArray> &names)
{
    // Opening a named pipe would wait for somebody to write into it.
    if (!QFileInfo(path).isFile())
        return ExportAnswer::Unknown;
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        return ExportAnswer::Unknown;
    const qint64 size = file.size();
    const uchar *data = size > 0 ? file.map(0, size) : nullptr;
    return data ? findElfExports(data, size, names) : ExportAnswer::Unknown;
}
