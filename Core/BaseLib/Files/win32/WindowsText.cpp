#include "Core/BaseLib/Files/win32/WindowsText.h"

#include "Core/BaseLib/Log/FormatText.h"

#include <QDir>

namespace {

/// Longest path that every system call takes: folders must leave room for a name of 8.3 characters.
constexpr int kShortPath = MAX_PATH - 12;

} // namespace

std::wstring nativePath(const QString &path)
{
    QString native = QDir::toNativeSeparators(path);
    if (native.size() >= kShortPath && !native.startsWith(QLatin1String(R"(\\?\)"))) {
        native = QDir::toNativeSeparators(QDir::cleanPath(QDir::fromNativeSeparators(native)));
        if (native.startsWith(QLatin1String(R"(\\)")))
            native.replace(0, 1, QStringLiteral(R"(\\?\UNC)"));
        else
            native.prepend(QLatin1String(R"(\\?\)"));
    }
    return native.toStdWString();
}

QString systemMessage(DWORD error, const QString &subject)
{
    wchar_t text[512] = {};
    const DWORD length = FormatMessageW(FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS, nullptr,
                                        error, 0, text, static_cast<DWORD>(std::size(text)), nullptr);
    QString message = QString::fromWCharArray(text, static_cast<int>(length)).simplified();
    if (message.endsWith(QLatin1Char('.'))) // it becomes a part of a sentence
        message.chop(1);
    if (message.isEmpty())
        return formatText(L"error %lu", error);
    return QString(message).replace(QLatin1String("%1"), subject);
}
