#pragma once

#include <QByteArray>
#include <QString>

/// A regular file open for reading in places.
class RegularFile {
public:
    explicit RegularFile(const QString &path);
    ~RegularFile();
    RegularFile(const RegularFile &) = delete;
    RegularFile &operator=(const RegularFile &) = delete;

    /// In bytes, when it was opened; 0 when it is missing, special or cannot be read.
    quint64 size() const { return m_size; }
    /// At most so many bytes from a place on; fewer where the file ends.
    QByteArray readAt(quint64 offset, int most) const;

private:
    int m_descriptor = -1;
    quint64 m_size = 0;
};
