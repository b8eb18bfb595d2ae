#pragma once

#include <QByteArray>
#include <QString>

#include <string>
#include <type_traits>

/// printf-style formatting of wide text that keeps every character.
///
/// The C library's wide printf converts text through the process's locale and gives up at the first character
/// that the locale lacks, and plug-in names hold any character. Here every text argument (QString,
/// std::wstring, wide or 8-bit C string) travels as UTF-8 and both "%s" and "%ls" take any of them. Numbers
/// are printed the same in every locale.
namespace FormatTextDetail {

template <typename Number>
std::enable_if_t<std::is_arithmetic_v<Number> || std::is_enum_v<Number>, Number> prepare(Number value)
{
    return value;
}
inline const void *prepare(const void *pointer) { return pointer; }
inline QByteArray prepare(const QString &text) { return text.toUtf8(); }
inline QByteArray prepare(const std::wstring &text) { return QString::fromStdWString(text).toUtf8(); }
inline QByteArray prepare(const QByteArray &utf8) { return utf8; }
inline QByteArray prepare(const wchar_t *text)
{
    return text ? QString::fromWCharArray(text).toUtf8() : QByteArray();
}
inline QByteArray prepare(const char *utf8) { return QByteArray(utf8); }

template <typename Number>
std::enable_if_t<std::is_arithmetic_v<Number> || std::is_enum_v<Number>, Number> pass(Number value)
{
    return value;
}
inline const void *pass(const void *pointer) { return pointer; }
inline const char *pass(const QByteArray &utf8) { return utf8.constData(); }

/// The same format for a printf whose text arguments are all UTF-8; a null format counts as an empty one.
QByteArray narrowFormat(const wchar_t *format);
/// Formats with QString's own, locale-independent printf.
QString printNarrow(const char *format, ...);

} // namespace FormatTextDetail

template <typename... Arguments>
QString formatText(const wchar_t *format, const Arguments &...arguments)
{
    using namespace FormatTextDetail;
    return printNarrow(narrowFormat(format).constData(), pass(prepare(arguments))...);
}

/// The text cut to at most `limit` UTF-16 units, never in the middle of a character outside the basic plane.
QString cutText(const QString &text, int limit);
