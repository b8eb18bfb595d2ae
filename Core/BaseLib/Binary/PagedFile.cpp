#include "Core/BaseLib/Binary/PagedFile.h"

#include <algorithm>
#include <cstring>

namespace {
constexpr int kPageSize = 4096; ///< bytes
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
    if (isNew)
        place->second = m_file.readAt(number * kPageSize, kPageSize);
    return place->second;
}
