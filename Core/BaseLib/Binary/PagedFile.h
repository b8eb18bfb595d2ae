#pragma once

#include "Core/BaseLib/Binary/ByteView.h"

#include <QFile>

#include <map>

/// The content of a regular file, of which only the pages that are looked at are read: a few of a large
/// module. Mapping the file would cost more, and would fault if it shrank meanwhile; here what is gone cannot
/// be read. Used on one thread.
class PagedFile : private ByteSource {
public:
    explicit PagedFile(const QString &path);

    /// Empty when the file is missing, special or cannot be read. Valid as long as this object.
    ByteView content() { return ByteView(*this, m_size); }
    /// The system's message for why it cannot be read; empty when it can.
    const QString &problem() const { return m_problem; }

private:
    bool read(quint64 offset, void *target, quint64 size) override;
    const QByteArray &page(quint64 number);

    QFile m_file;
    QString m_problem;
    quint64 m_size = 0;                    ///< bytes, when it was opened
    std::map<quint64, QByteArray> m_pages; ///< by number
};
