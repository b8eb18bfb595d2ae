#include "Core/BaseLib/Log/FormatText.h"

#include <cstdarg>

QByteArray FormatTextDetail::narrowFormat(const wchar_t *format)
{
    if (!format)
        return QByteArray();
    return QString::fromWCharArray(format).toUtf8().replace("%ls", "%s");
}

QString FormatTextDetail::printNarrow(const char *format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    const QString text = QString::vasprintf(format, arguments);
    va_end(arguments);
    return text;
}

QString cutText(const QString &text, int limit)
{
    if (text.size() <= limit)
        return text;
    const bool splitsPair = limit > 0 && text.at(limit - 1).isHighSurrogate();
    return text.left(splitsPair ? limit - 1 : limit);
}
