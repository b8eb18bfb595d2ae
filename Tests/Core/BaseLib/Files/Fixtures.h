#pragma once

#include "Core/BaseLib/Binary/BinaryExports.h"
#include "Core/BaseLib/Files/TextFile.h"

#include "Tests/Support/QtPrinters.h"

#include <QDir>
#include <QTemporaryDir>

#include <algorithm>
#include <clocale>
#include <memory>
#include <ostream>
#include <string>

inline void PrintTo(ExportAnswer answer, std::ostream *out)
{
    const char *const kNames[] = {"Exported", "NotExported", "Unknown"};
    *out << kNames[static_cast<int>(answer)];
}

inline QString operator""_q(const char *utf8, std::size_t length)
{
    return QString::fromUtf8(utf8, static_cast<int>(length));
}

/// A folder of a test's own, empty at first and gone when the test ends.
class EmptyFolder {
public:
    QString path(const QString &name = QString()) const { return m_folder.filePath(name); }
    QByteArray nativePath(const QByteArray &name) const { return QFile::encodeName(path()) + '/' + name; }

    /// Writes a file, and the folders it lies in; gives its path.
    QString write(const QString &name, const QByteArray &content = QByteArray()) const
    {
        QDir().mkpath(QFileInfo(path(name)).path());
        QFile file(path(name));
        if (!file.open(QIODevice::WriteOnly) || file.write(content) != content.size())
            qFatal("cannot write a test's file");
        return path(name);
    }

    /// Everything that lies directly in the folder, by name.
    QStringList names() const
    {
        return QDir(path()).entryList(QDir::AllEntries | QDir::Hidden | QDir::System | QDir::NoDotAndDotDot);
    }

private:
    QTemporaryDir m_folder;
};

/// Bytes at an odd address with nothing behind them, where a sanitizer sees every step aside.
class OddBytes {
public:
    explicit OddBytes(const QByteArray &content)
        : m_bytes(new uchar[static_cast<std::size_t>(content.size()) + 1])
        , m_size(static_cast<quint64>(content.size()))
    {
        std::copy(content.begin(), content.end(), m_bytes.get() + 1);
    }
    ByteView view() const { return ByteView(m_bytes.get() + 1, m_size); }

private:
    std::unique_ptr<uchar[]> m_bytes;
    quint64 m_size;
};

inline QByteArray contentOf(const QString &path)
{
    QByteArray content;
    const FileResult read = readWholeFile(path, content);
    return read ? content : QByteArray("unreadable: ") + read.reason.toUtf8();
}

/// Collects what goes to Qt's debug channel while it lives.
class QtMessages {
public:
    QtMessages()
        : m_previous(qInstallMessageHandler(
              [](QtMsgType, const QMessageLogContext &, const QString &line) { s_lines.append(line); }))
    {
        s_lines.clear();
    }
    ~QtMessages() { qInstallMessageHandler(m_previous); }
    Q_DISABLE_COPY(QtMessages)

    const QStringList &lines() const { return s_lines; }

private:
    inline static QStringList s_lines;
    QtMessageHandler m_previous;
};

/// The locales that text and numbers have to survive: plain bytes, UTF-8, and one with a decimal comma.
inline constexpr const char *kLocales[] = {"C", "C.UTF-8", "de_DE.UTF-8"};

/// Sets the C locale for a scope, where the machine has it.
class LocaleScope {
public:
    explicit LocaleScope(const char *name)
        : m_previous(std::setlocale(LC_ALL, nullptr))
        , m_isSet(std::setlocale(LC_ALL, name) != nullptr)
    {}
    ~LocaleScope() { std::setlocale(LC_ALL, m_previous.c_str()); }
    Q_DISABLE_COPY(LocaleScope)

    bool isSet() const { return m_isSet; }

private:
    std::string m_previous;
    bool m_isSet;
};
