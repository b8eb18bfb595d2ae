#include "Core/BaseLib/Files/RegularFile.h"

#include <QFile>

#include <algorithm>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

RegularFile::RegularFile(const QString &path)
    // Opening a named pipe would otherwise wait for somebody to write into it.
    : m_descriptor(open(QFile::encodeName(path).constData(), O_RDONLY | O_CLOEXEC | O_NONBLOCK))
{
    struct stat status = {};
    if (m_descriptor >= 0 && fstat(m_descriptor, &status) == 0 && S_ISREG(status.st_mode))
        m_size = static_cast<quint64>(status.st_size);
}

RegularFile::~RegularFile()
{
    if (m_descriptor >= 0)
        close(m_descriptor);
}

QByteArray RegularFile::readAt(quint64 offset, int most) const
{
    QByteArray bytes(most, Qt::Uninitialized);
    const ssize_t got =
        pread(m_descriptor, bytes.data(), static_cast<std::size_t>(most), static_cast<off_t>(offset));
    bytes.resize(static_cast<int>(std::max<ssize_t>(got, 0)));
    return bytes;
}
