#include "Core/BaseLib/MappedFile.h"

#include <QFileInfo>

MappedFile::MappedFile(const QString &path)
    : m_file(path)
{
    // Opening a named pipe would wait for somebody to write into it.
    if (!QFileInfo(path).isFile() || !m_file.open(QIODevice::ReadOnly))
        return;
    const qint64 size = m_file.size();
    if (const uchar *data = size > 0 ? m_file.map(0, size) : nullptr)
        m_content = ByteView(data, static_cast<quint64>(size));
}
