#pragma once

#include <QByteArray>

#include <algorithm>
#include <cstring>
#include <optional>
#include <type_traits>

/// A stretch of bytes that belong to somebody else. Nothing outside of it is read, whatever position is asked
/// for: positions and sizes may come from a hostile file.
class ByteView {
public:
    ByteView() = default;
    ByteView(const uchar *data, quint64 size)
        : m_data(data)
        , m_size(size)
    {}

    quint64 size() const { return m_size; }
    bool isEmpty() const { return m_size == 0; }

    /// The bytes from `offset` to the end; empty when there are none.
    ByteView from(quint64 offset) const
    {
        return offset < m_size ? ByteView(m_data + offset, m_size - offset) : ByteView();
    }

    /// `size` bytes at `offset`; none when they are not all there.
    std::optional<ByteView> part(quint64 offset, quint64 size) const
    {
        if (offset > m_size || size > m_size - offset)
            return std::nullopt;
        return ByteView(m_data + offset, size);
    }

    /// Item `index` of a table of T that starts with the first byte, which may lie at any alignment.
    template <typename T>
    std::optional<T> item(quint64 index) const
    {
        static_assert(std::is_trivially_copyable_v<T>, "items are copied byte by byte");
        if (index >= m_size / sizeof(T))
            return std::nullopt;
        T value;
        std::memcpy(&value, m_data + index * sizeof(T), sizeof(T));
        return value;
    }

    /// Whether the text stands at `offset`, with its terminating zero.
    bool holdsText(quint64 offset, const QByteArray &text) const
    {
        const auto length = static_cast<quint64>(text.size());
        const std::optional<ByteView> place = part(offset, length + 1);
        return place && std::memcmp(place->m_data, text.constData(), length) == 0 &&
               place->m_data[length] == 0;
    }

    /// The text that starts at `offset` and ends with a zero; none when it has more than `most` characters.
    std::optional<QByteArray> text(quint64 offset, quint64 most) const
    {
        const ByteView rest = from(offset);
        const auto length = std::min(rest.m_size, most + 1);
        const void *end = length == 0 ? nullptr : std::memchr(rest.m_data, 0, length);
        if (!end)
            return std::nullopt;
        const auto *start = reinterpret_cast<const char *>(rest.m_data);
        return QByteArray(start, static_cast<int>(static_cast<const char *>(end) - start));
    }

private:
    const uchar *m_data = nullptr;
    quint64 m_size = 0;
};
