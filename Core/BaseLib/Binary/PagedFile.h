#pragma once

#include "Core/BaseLib/Binary/ByteView.h"
#include "Core/BaseLib/Files/RegularFile.h"

#include <map>

/// The content of a regular file, of which only the pages that are looked at are read: of a large module a
/// few. Mapping it would cost more, and a fault if the file shrinks meanwhile; here what is lost cannot be
/// read. Used on one thread.
class PagedFile : private ByteSource {
public:
    explicit PagedFile(const QString &path)
        : m_file(path)
    {}

    /// Empty when the file is missing, special or cannot be read. Valid as long as this object.
    ByteView content() { return ByteView(*this, m_file.size()); }

private:
    bool read(quint64 offset, void *target, quint64 size) override;
    const QByteArray &page(quint64 number);

    RegularFile m_file;
    std::map<quint64, QByteArray> m_pages; ///< by number
};
