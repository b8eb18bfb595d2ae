#include "Core/BaseLib/Log/HarmlessText.h"

#include <QVector>

namespace {

/// What sets the direction of text: Unicode Standard Annex 9, "Directional formatting characters".
bool setsDirection(uint character)
{
    return character == 0x061C || character == 0x200E || character == 0x200F ||
           (character >= 0x202A && character <= 0x202E) || (character >= 0x2066 && character <= 0x2069);
}

bool isHarmless(uint character)
{
    switch (QChar::category(character)) {
    case QChar::Other_Control:
    case QChar::Other_Surrogate:
    case QChar::Separator_Line:
    case QChar::Separator_Paragraph:
        return false;
    default:
        return !setsDirection(character);
    }
}

} // namespace

QString harmlessText(const QString &text)
{
    QVector<uint> characters = text.toUcs4();
    for (uint &character : characters)
        if (!isHarmless(character))
            character = '?';
    return QString::fromUcs4(characters.constData(), characters.size());
}
