#include "Core/BaseLib/MappedFile.h"

#include <QFile>
#include <QFileInfo>

MappedFile::MappedFile(const QString &path)
{
    const auto file = std::make_shared<QFile>(path);
    // What is no file may keep whoever opens it waiting.
    if (!QFileInfo(path).isFile() || !file->open(QIODevice::ReadOnly))
        return;
    const qint64 size = file->size();
    if (const uchar *data = size > 0 ? file->map(0, size) : nullptr) {
        m_mapping = file;
        m_content = ByteView(data, static_cast<quint64>(size));
    }
}
