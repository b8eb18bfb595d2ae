#include "Main/AudioEngineController/Effects/VST3/VST3ClassId.h"

#include <QRegularExpression>

using namespace Steinberg;

QString classIdText(const FUID &classId)
{
    char8 text[33] = {}; // 32 digits, see FUID::toString
    classId.toString(text);
    return QString::fromLatin1(text);
}

FUID classIdOf(const QString &identifier)
{
    static const QRegularExpression digits(QStringLiteral("\\A[0-9A-Fa-f]{32}\\z"));
    FUID classId;
    if (digits.match(identifier).hasMatch())
        classId.fromString(identifier.toLatin1().constData());
    return classId;
}
