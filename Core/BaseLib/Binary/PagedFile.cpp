#include "Core/BaseLib/Binary/PagedFile.h"

#include <QFileInfo>

#include <algorithm>
#include <cstring>

namespace {
constexpr int kPageSize = 4096; ///< bytes
}

PagedFile::PagedFile(const QString &path)
    : m_file(path)
{
    // Opening a pipe would wait for somebody to write into it.
    const QFileInfo file(path);
    if (file.exists() && !file.isFile())
        m_problem = QStringLiteral("it is not a regular file");
    else if (!m_file.open(QIODevice::ReadOnly | QIODevice::Unbuffered))
        m_problem = m_file.errorString();
    else
        m_size = static_cast<quint64>(m_file.size());
}

bool PagedFile::read(quint64 offset, void *target, quint64 size)
{
    auto *place = static_cast<char *>(target);
    while (size > 0) {
        const QByteArray &bytes = page(offset / kPageSize);
        const quint64 start = offset % kPageSize;
        const auto held = static_cast<quint64>(bytes.size());
        if (start >= held)
            return false;
        const quint64 step = std::min(size, held - start);
        std::memcpy(place, bytes.constData() + start, step);
        place += step;
        offset += step;
        size -= step;
    }
    return true;
}

const QByteArray &PagedFile::page(quint64 number)
{
    const auto [place, isNew] = m_pages.try_emplace(number);
    if (isNew && m_file.seek(static_cast<qint64>(number * kPageSize)))
        place->second = m_file.read(kPageSize);
    return place->second;
}
