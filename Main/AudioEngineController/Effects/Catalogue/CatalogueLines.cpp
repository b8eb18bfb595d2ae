#include "Main/AudioEngineController/Effects/Catalogue/CatalogueLines.h"

#include <QStringList>

#include <cstring>

namespace {

constexpr char kHeader[] = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>";
constexpr char kRootStart[] = "<Effects version=\"";
constexpr char kRootEnd[] = "\">";

/// A place in a text that moves on over what is expected there.
class Lines {
public:
    explicit Lines(const QByteArray &text)
        : m_text(text)
    {
        const int firstEnd = text.indexOf('\n');
        m_lineEnd = firstEnd > 0 && text.at(firstEnd - 1) == '\r' ? "\r\n" : "\n";
    }

    bool startsWith(const char *expected) const
    {
        return std::strncmp(m_text.constData() + m_at, expected, std::strlen(expected)) == 0;
    }
    bool take(const char *expected)
    {
        if (!startsWith(expected))
            return false;
        m_at += static_cast<int>(std::strlen(expected));
        return true;
    }
    bool takeLine(const char *line) { return take(line) && take(m_lineEnd); }
    bool isAtEnd() const { return m_at == m_text.size(); }

    /// The bytes up to a line's end that reads `closing`, and moves behind that line's end; null when there
    /// is none. `isNext` says whether what follows may follow: a text may look like an end itself.
    template <typename IsNext>
    ElementContent takeUntil(const char *closing, bool &found, IsNext &&isNext)
    {
        const QByteArray end = QByteArray(closing) + m_lineEnd;
        const int start = m_at;
        for (int at = m_text.indexOf(end, start); at >= 0; at = m_text.indexOf(end, at + 1)) {
            m_at = at + end.size();
            if (!isNext())
                continue;
            found = true;
            return {m_text.constData() + start, at - start};
        }
        m_at = start;
        found = false;
        return {};
    }

private:
    const QByteArray &m_text;
    const char *m_lineEnd;
    int m_at = 0;
};

/// The tags of an element of a format, spelt once.
struct ElementTags {
    const CatalogueElement *element;
    QByteArray opening; ///< with its indentation
    QByteArray closing;
};

std::vector<ElementTags> tagsOf(const CatalogueFormat &format)
{
    std::vector<ElementTags> tags;
    for (const CatalogueElement &element : format.elements)
        if (element.content)
            tags.push_back(
                {&element, QByteArray("\t\t<") + element.name + '>', QByteArray("</") + element.name + '>'});
    return tags;
}

/// Reads the elements of a record, from the one after its first line to its last line.
bool takeElements(Lines &lines, const std::vector<ElementTags> &tags, EffectRecord &record)
{
    for (auto tag = tags.begin(); tag != tags.end(); ++tag) {
        if (!lines.take(tag->opening.constData()))
            continue; // left out: only what a plug-in does not have is
        const auto isNext = [&] {
            for (auto later = tag + 1; later != tags.end(); ++later)
                if (lines.startsWith(later->opening.constData()))
                    return true;
            return lines.startsWith("\t</Effect>");
        };
        bool found = false;
        const ElementContent content = lines.takeUntil(tag->closing.constData(), found, isNext);
        if (!found)
            return false;
        if (tag->element->read)
            tag->element->read(record, content);
    }
    return lines.takeLine("\t</Effect>");
}

} // namespace

CatalogueLines readCatalogueLines(const CatalogueFormat &format, const QByteArray &content)
{
    CatalogueLines read;
    Lines lines(content);
    bool hasVersion = false;
    if (!lines.takeLine(kHeader) || !lines.take(kRootStart))
        return read;
    read.version = lines.takeUntil(kRootEnd, hasVersion, [] { return true; }).text();
    if (!hasVersion)
        return read;
    const std::vector<ElementTags> tags = tagsOf(format);
    while (lines.takeLine("\t<Effect>")) {
        EffectRecord record;
        if (!takeElements(lines, tags, record))
            return read;
        read.records.push_back(std::move(record));
    }
    read.isWhole = lines.takeLine("</Effects>") && lines.isAtEnd();
    return read;
}

bool readScanListLines(const QByteArray &content, QStringList &folders)
{
    Lines lines(content);
    if (!lines.takeLine(kHeader) || !lines.takeLine("<Scan>"))
        return false;
    const auto isNext = [&] { return lines.startsWith("\t<Path>") || lines.startsWith("</Scan>"); };
    while (lines.take("\t<Path>")) {
        bool found = false;
        const ElementContent folder = lines.takeUntil("</Path>", found, isNext);
        if (!found)
            break;
        folders.append(folder.text());
    }
    if (lines.takeLine("</Scan>") && lines.isAtEnd())
        return true;
    folders.clear();
    return false;
}
