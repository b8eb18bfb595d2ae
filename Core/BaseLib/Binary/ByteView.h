#pragma once

#include <QByteArray>

#include <algorithm>
#include <cstring>
#include <optional>
#include <type_traits>

/// Bytes that are fetched when they are asked for.
class ByteSource {
public:
    virtual ~ByteSource() = default;
    /// Copies bytes; false when they cannot all be had.
    virtual bool read(quint64 offset, void *target, quint64 size) = 0;
};

/// A range of bytes, not owned, in memory or in a source. Nothing outside of it is ever read: positions and
/// sizes may come from a hostile file.
class ByteView {
public:
    ByteView() = default;
    ByteView(const uchar *data, quint64 size)
        : m_data(data)
        , m_size(size)
    {}
    ByteView(ByteSource &source, quint64 size)
        : m_source(&source)
        , m_size(size)
    {}

    quint64 size() const { return m_size; }
    bool isEmpty() const { return m_size == 0; }

    /// The bytes from `offset` to the end; empty when there are none.
    ByteView from(quint64 offset) const
    {
        return offset < m_size ? inside(offset, m_size - offset) : ByteView();
    }

    /// `size` bytes at `offset`; none when they are not all there.
    std::optional<ByteView> part(quint64 offset, quint64 size) const
    {
        if (offset > m_size || size > m_size - offset)
            return std::nullopt;
        return inside(offset, size);
    }

    /// Item `index` of a table of T that starts with the first byte, which may lie at any alignment.
    template <typename T>
    std::optional<T> item(quint64 index) const
    {
        static_assert(std::is_trivially_copyable_v<T>, "items are copied byte by byte");
        if (index >= m_size / sizeof(T))
            return std::nullopt;
        T value;
        return copy(index * sizeof(T), &value, sizeof(T)) ? std::make_optional(value) : std::nullopt;
    }

    /// Whether the first bytes are all zero; false when they are not all there.
    bool hasOnlyZeros(quint64 size) const
    {
        QByteArray found(static_cast<int>(std::min(size, m_size)), Qt::Uninitialized);
        return size > 0 && size <= m_size && copy(0, found.data(), size) && found.count('\0') == found.size();
    }

    /// Whether the text stands at `offset`, with its terminating zero.
    bool holdsText(quint64 offset, const QByteArray &text) const
    {
        QByteArray found(text.size() + 1, Qt::Uninitialized);
        const auto size = static_cast<quint64>(found.size());
        return part(offset, size) && copy(offset, found.data(), size) &&
               std::memcmp(found.constData(), text.constData(), size) == 0;
    }

    /// The text that starts at `offset` and ends with a zero; none when it has more than `most` characters.
    std::optional<QByteArray> text(quint64 offset, quint64 most) const
    {
        QByteArray found(static_cast<int>(std::min(from(offset).m_size, most + 1)), Qt::Uninitialized);
        if (!copy(offset, found.data(), static_cast<quint64>(found.size())))
            return std::nullopt;
        const int length = found.indexOf('\0');
        return length < 0 ? std::nullopt : std::make_optional(found.left(length));
    }

private:
    /// A part that is known to lie inside.
    ByteView inside(quint64 offset, quint64 size) const
    {
        ByteView part(*this);
        part.m_data += m_source ? 0 : offset;
        part.m_offset += offset;
        part.m_size = size;
        return part;
    }

    bool copy(quint64 offset, void *target, quint64 size) const
    {
        if (m_source)
            return m_source->read(m_offset + offset, target, size);
        if (size > 0)
            std::memcpy(target, m_data + offset, size);
        return true;
    }

    const uchar *m_data = nullptr;
    ByteSource *m_source = nullptr; ///< in place of data
    quint64 m_offset = 0;           ///< in the source
    quint64 m_size = 0;
};
