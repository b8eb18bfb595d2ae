#pragma once

#include "Core/BaseLib/Binary/BinaryExports.h"

#include <QFile>

#include <algorithm>
#include <memory>
#include <ostream>

inline void PrintTo(ExportAnswer answer, std::ostream *out)
{
    const char *const kNames[] = {"Exported", "NotExported", "Unknown"};
    *out << kNames[static_cast<int>(answer)];
}

inline QString corpusPath(const QString &name) { return QStringLiteral(FXPROBE_FUZZ_CORPUS "/") + name; }

/// A library from the corpus of the fuzz targets, with means to damage it.
class CorpusFile {
public:
    explicit CorpusFile(const QString &name)
    {
        QFile file(corpusPath(name));
        content = file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
    }
    /// Writes a number of `width` bytes, as machines of little end first do.
    void put(int offset, int width, quint64 value)
    {
        content.replace(offset, width, reinterpret_cast<const char *>(&value), width);
    }
    /// The content at an odd address with nothing behind it, where a sanitizer sees every step aside.
    ByteView view()
    {
        m_odd.reset(new uchar[static_cast<std::size_t>(content.size()) + 1]);
        std::copy(content.begin(), content.end(), m_odd.get() + 1);
        return ByteView(m_odd.get() + 1, static_cast<quint64>(content.size()));
    }

    QByteArray content;

private:
    std::unique_ptr<uchar[]> m_odd;
};
