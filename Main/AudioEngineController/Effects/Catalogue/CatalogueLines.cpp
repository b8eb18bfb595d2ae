#include "Main/AudioEngineController/Effects/Catalogue/CatalogueLines.h"

#include "Core/BaseLib/Files/TextFile.h"
#include "Core/BaseLib/Files/XMLDocument.h"

#include <QStringList>

#include <algorithm>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace {

constexpr char kByteOrderMark[] = "\xef\xbb\xbf";
constexpr char kHeader[] = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>";
constexpr char kRootStart[] = "<Effects version=\"";
constexpr char kRootEnd[] = "\">";
constexpr char kRecordEnd[] = "\t</Effect>";
constexpr char kLineOfRecordEnd[] = "\n\t</Effect>";

/// A place in a text that moves on over what is expected there.
class Lines {
public:
    explicit Lines(const QByteArray &text)
        : m_text(text.constData(), static_cast<std::size_t>(text.size()))
    {
        const std::size_t firstEnd = m_text.find('\n');
        const bool hasReturns = firstEnd != 0 && firstEnd != m_text.npos && m_text[firstEnd - 1] == '\r';
        m_lineEnd = hasReturns ? "\r\n" : "\n";
    }

    std::string_view lineEnd() const { return m_lineEnd; }
    bool startsWith(std::string_view expected) const
    {
        return m_text.compare(m_at, expected.size(), expected) == 0;
    }
    bool take(std::string_view expected)
    {
        if (!startsWith(expected))
            return false;
        m_at += expected.size();
        return true;
    }
    bool takeLine(std::string_view line) { return take(line) && take(m_lineEnd); }
    bool isAtEnd() const { return m_at == m_text.size(); }

    /// The bytes up to `end`, which has the end of its line; moves behind it. Nothing, and no move, when
    /// there is no end behind which `isNext` holds: a text may look like an end itself. Nor where that is
    /// behind the end of a record: its own is damaged.
    template <typename IsNext>
    std::optional<ElementContent> takeUntil(std::string_view end, IsNext &&isNext)
    {
        const std::size_t start = m_at;
        for (std::size_t at = m_text.find(end, start); at != m_text.npos; at = m_text.find(end, at + 1)) {
            if (m_text.substr(start, at - start).find(kLineOfRecordEnd) != m_text.npos)
                break;
            m_at = at + end.size();
            if (isNext())
                return ElementContent(m_text.data() + start, static_cast<int>(at - start));
        }
        m_at = start;
        return std::nullopt;
    }

private:
    std::string_view m_text;
    std::string_view m_lineEnd;
    std::size_t m_at = 0;
};

/// The tags of an element of a format, spelt once.
struct ElementTags {
    const CatalogueElement *element;
    std::string opening; ///< with its indentation
    std::string closing; ///< with the end of its line
};

std::vector<ElementTags> tagsOf(const CatalogueFormat &format, std::string_view lineEnd)
{
    std::vector<ElementTags> tags;
    for (const CatalogueElement &element : format.elements) {
        const std::string name = std::string(element.name) + '>';
        if (element.content)
            tags.push_back({&element, "\t\t<" + name, "</" + name + std::string(lineEnd)});
    }
    return tags;
}

/// Reads the elements of a record, from the one after its first line to its last line.
bool takeElements(Lines &lines, const std::vector<ElementTags> &tags, EffectRecord &record, bool &hasAll)
{
    for (auto tag = tags.begin(); tag != tags.end(); ++tag) {
        if (!lines.take(tag->opening)) {
            hasAll &= !tag->element->content(record).has_value(); // what a plug-in does not have is left out
            continue;
        }
        const auto isNext = [&] {
            const auto isOpened = [&](const ElementTags &later) { return lines.startsWith(later.opening); };
            return std::any_of(tag + 1, tags.end(), isOpened) || lines.startsWith(kRecordEnd);
        };
        const std::optional<ElementContent> content = lines.takeUntil(tag->closing, isNext);
        if (!content)
            return false;
        if (tag->element->read)
            tag->element->read(record, *content);
    }
    return lines.takeLine(kRecordEnd);
}

/// The version that a line with the root's opening tag states: none is no version.
std::optional<QString> versionOf(const QByteArray &line)
{
    XMLDocument root;
    return root.parse(line + "</Effects>") ? root.root("Effects").attribute("version") : std::nullopt;
}

/// Reads the lines of one record of an edited file, each by itself.
class EditedRecord {
public:
    explicit EditedRecord(const CatalogueFormat &format)
        : m_format(format)
    {}

    /// False for a line that is no element, and no part of one.
    bool take(const QByteArray &line)
    {
        if (m_block && line == "</" + m_block->name + '>') {
            read(m_block->name, m_block->content + "\t\t");
            m_block.reset();
            return true;
        }
        const int nameEnd = line.indexOf('>');
        const QByteArray name = line.mid(1, nameEnd - 1);
        const QByteArray closing = "</" + name + '>';
        if (nameEnd < 2 || line.front() != '<')
            return false;
        if (line.size() == nameEnd + 1 && !m_block && !line.contains('/')) {
            m_block = Block{name, kLineEnd};
            return true;
        }
        if (!line.endsWith(closing) || line.size() < nameEnd + 1 + closing.size())
            return false;
        if (m_block)
            m_block->content += "\t\t\t" + line + kLineEnd;
        else
            read(name, line.mid(nameEnd + 1, line.size() - nameEnd - 1 - closing.size()));
        return true;
    }
    /// Whether the lines tell enough to go by.
    bool isUsable() const { return !m_block && m_hasState; }

    EffectRecord record;

private:
    struct Block {
        QByteArray name;
        QByteArray content;
    };

    void read(const QByteArray &name, const QByteArray &content)
    {
        m_hasState |= name == CatalogueElements::kEnabled.name || name == CatalogueElements::kWorking.name;
        for (const CatalogueElement &element : m_format.elements)
            if (element.read && name == element.name)
                element.read(record, ElementContent(content.constData(), content.size()));
    }

    const CatalogueFormat &m_format;
    std::optional<Block> m_block; ///< an element of several lines, in our layout, as far as it was read
    bool m_hasState = false;
};

} // namespace

CatalogueLines readCatalogueLines(const CatalogueFormat &format, const QByteArray &content)
{
    CatalogueLines read;
    Lines lines(content);
    if (!lines.takeLine(kHeader) || !lines.take(kRootStart))
        return read;
    const std::optional<ElementContent> version =
        lines.takeUntil(kRootEnd + std::string(lines.lineEnd()), [] { return true; });
    if (!version)
        return read;
    read.version = version->text();
    read.isAsWritten = lines.lineEnd() == kLineEnd;
    const std::vector<ElementTags> tags = tagsOf(format, lines.lineEnd());
    while (lines.takeLine("\t<Effect>")) {
        EffectRecord record;
        if (!takeElements(lines, tags, record, read.isAsWritten))
            return read;
        read.records.push_back(std::move(record));
    }
    read.isWhole = lines.takeLine("</Effects>") && lines.isAtEnd();
    return read;
}

CatalogueLines readEditedLines(const CatalogueFormat &format, const QByteArray &content)
{
    CatalogueLines read;
    read.isAsWritten = false;
    read.isWhole = true;
    std::unique_ptr<EditedRecord> record; // that has begun
    const int start = content.startsWith(kByteOrderMark) ? static_cast<int>(qstrlen(kByteOrderMark)) : 0;
    for (const QByteArray &untrimmed : content.mid(start).split('\n')) {
        const QByteArray line = untrimmed.trimmed();
        const bool isComment = line.startsWith("<!--") && line.endsWith("-->");
        if (line == "<Effect>" || line == "</Effect>") {
            const bool isEnd = line.at(1) == '/';
            read.isWhole &= isEnd == bool(record) && (!isEnd || record->isUsable());
            if (isEnd && record && record->isUsable())
                read.records.push_back(record->record);
            record.reset();
            if (!isEnd)
                record = std::make_unique<EditedRecord>(format);
        } else if (line.isEmpty() || isComment) {
            continue;
        } else if (record) {
            read.isWhole &= record->take(line);
        } else if (line.startsWith("<Effects") && !read.version) {
            read.version = versionOf(line);
        } else if (!line.startsWith("<?xml ") && line != "</Effects>") {
            read.isWhole = false;
        }
    }
    read.isWhole &= !record;
    return read;
}

bool readScanListLines(const QByteArray &content, QStringList &folders)
{
    Lines lines(content);
    if (!lines.takeLine(kHeader) || !lines.takeLine("<Scan>"))
        return false;
    const auto isNext = [&] { return lines.startsWith("\t<Path>") || lines.startsWith("</Scan>"); };
    const std::string closing = "</Path>" + std::string(lines.lineEnd());
    while (lines.take("\t<Path>")) {
        const std::optional<ElementContent> folder = lines.takeUntil(closing, isNext);
        if (!folder)
            break;
        folders.append(folder->text());
    }
    if (lines.takeLine("</Scan>") && lines.isAtEnd())
        return true;
    folders.clear();
    return false;
}
