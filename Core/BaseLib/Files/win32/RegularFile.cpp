#include "Core/BaseLib/Files/RegularFile.h"

#include "Core/BaseLib/Files/win32/WindowsText.h"

#include <QFileInfo>

#include <algorithm>

#include <fcntl.h>
#include <io.h>

RegularFile::RegularFile(const QString &path)
    // What is no file may keep whoever opens it waiting.
    : m_descriptor(QFileInfo(path).isFile()
                       ? _wopen(nativePath(path).c_str(), _O_RDONLY | _O_BINARY | _O_NOINHERIT)
                       : -1)
{
    if (m_descriptor >= 0)
        m_size = static_cast<quint64>(std::max<qint64>(_filelengthi64(m_descriptor), 0));
}

RegularFile::~RegularFile()
{
    if (m_descriptor >= 0)
        _close(m_descriptor);
}

QByteArray RegularFile::readAt(quint64 offset, int most) const
{
    if (_lseeki64(m_descriptor, static_cast<qint64>(offset), SEEK_SET) < 0)
        return {};
    QByteArray bytes(most, Qt::Uninitialized);
    bytes.resize(std::max(_read(m_descriptor, bytes.data(), static_cast<unsigned>(most)), 0));
    return bytes;
}
