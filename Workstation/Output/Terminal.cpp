#include "Workstation/Output/Terminal.h"

#include "Core/BaseLib/Log/HarmlessText.h"
#include "Workstation/Output/TerminalStream.h"

#include <QStringList>
#include <QVector>

#include <algorithm>

namespace {

/// Where results go.
std::FILE *s_result = stdout;

bool write(std::FILE *stream, const QString &text)
{
    if (const std::optional<bool> isWritten = TerminalStream::writeAsText(stream, text))
        return *isWritten;
    const QByteArray bytes = text.toUtf8();
    const auto size = static_cast<std::size_t>(bytes.size());
    return std::fwrite(bytes.constData(), 1, size, stream) == size && std::fflush(stream) == 0;
}

struct Range {
    uint first;
    uint last;
};

/// Characters of two columns: the blocks that are wide as a whole in Unicode's EastAsianWidth.txt.
constexpr Range kWide[] = {{0x1100, 0x115F},   {0x2E80, 0x303E},   {0x3041, 0xA4CF},  {0xAC00, 0xD7A3},
                           {0xF900, 0xFAFF},   {0xFE30, 0xFE6F},   {0xFF00, 0xFF60},  {0xFFE0, 0xFFE6},
                           {0x1F300, 0x1F64F}, {0x1F680, 0x1F9FF}, {0x20000, 0x3FFFD}};
template <std::size_t Size>
bool isIn(const Range (&ranges)[Size], uint character)
{
    return std::any_of(std::begin(ranges), std::end(ranges), [=](const Range &range) {
        return character >= range.first && character <= range.last;
    });
}

int columnsOf(uint character)
{
    const QChar::Category category = QChar::category(character);
    if (category == QChar::Mark_NonSpacing || category == QChar::Mark_Enclosing)
        return 0;
    return isIn(kWide, character) ? 2 : 1;
}

} // namespace

bool Terminal::print(const QString &text) { return write(s_result, text); }

bool Terminal::printError(const QString &text) { return write(stderr, text); }

void Terminal::complain(const QString &text)
{
    // Of the lines of a list all but the first are indented: a text in it cannot look like a message of ours.
    const QLatin1String indented("\n  ");
    QStringList lines = text.split(indented);
    for (QString &line : lines)
        line = harmless(line);
    printError(QStringLiteral("fxscan: %1\n").arg(lines.join(indented)));
}

bool Terminal::outputIsTerminal() { return TerminalStream::isTerminal(s_result); }

int Terminal::outputWidth() { return TerminalStream::width(s_result); }

int Terminal::errorWidth()
{
    constexpr int kUsualWidth = 80;
    const int width = TerminalStream::width(stderr);
    return width > 0 ? width : kUsualWidth;
}

void Terminal::keepOutputForResult()
{
    if (std::FILE *stream = TerminalStream::takeOutput())
        s_result = stream;
}

QString Terminal::harmless(const QString &text) { return harmlessText(text); }

int Terminal::width(const QString &text)
{
    int columns = 0;
    for (const uint character : text.toUcs4())
        columns += columnsOf(character);
    return columns;
}

QString Terminal::cell(const QString &text, int columns)
{
    const int whole = width(text);
    if (whole <= columns)
        return text + QString(columns - whole, QLatin1Char(' '));
    QVector<uint> kept;
    int used = 1; // the "…"
    for (const uint character : text.toUcs4()) {
        if (used + columnsOf(character) > columns)
            break;
        used += columnsOf(character);
        kept.append(character);
    }
    return QString::fromUcs4(kept.constData(), kept.size()) + QChar(0x2026) +
           QString(std::max(0, columns - used), QLatin1Char(' '));
}

bool Terminal::printData(const QString &text)
{
    if (!outputIsTerminal())
        return print(text);
    QStringList lines = text.split(QLatin1Char('\n'));
    for (QString &line : lines)
        line = harmless(line.remove(QLatin1Char('\r')));
    return print(lines.join(QLatin1Char('\n')));
}
