#include "Core/BaseLib/Files/XMLDocument.h"

#include "Core/BaseLib/Files/TextFile.h"
#include "Core/BaseLib/Log/FormatText.h"

#include <charconv>
#include <cmath>
#include <cstdlib>

#include <pugixml.hpp>

namespace {

// A text of blanks alone is a value too: a plug-in may be called " ". Line ends within a text stay as they
// are: file names may hold them.
constexpr unsigned kParseOptions = (pugi::parse_default | pugi::parse_ws_pcdata_single) & ~pugi::parse_eol;

constexpr char kByteOrderMark[] = "\xef\xbb\xbf";

} // namespace

XMLElement XMLElement::child(const char *name) const
{
    return XMLElement(pugi::xml_node(m_node).child(name).internal_object());
}

std::vector<XMLElement> XMLElement::children(const char *name) const
{
    std::vector<XMLElement> found;
    for (const pugi::xml_node node : pugi::xml_node(m_node).children(name))
        found.push_back(XMLElement(node.internal_object()));
    return found;
}

const char *XMLElement::utf8() const { return pugi::xml_node(m_node).text().get(); }

QString XMLElement::text() const { return textOfUtf8(utf8(), static_cast<int>(qstrlen(utf8()))); }

qint64 XMLElement::integer() const { return integerOfUtf8(utf8()); }

std::optional<QString> XMLElement::attribute(const char *name) const
{
    const pugi::xml_attribute found = pugi::xml_node(m_node).attribute(name);
    if (!found)
        return std::nullopt;
    return QString::fromUtf8(found.value());
}

XMLDocument::XMLDocument(Entities entities)
    : m_entities(entities)
    , m_document(std::make_unique<pugi::xml_document>())
{}

XMLDocument::~XMLDocument() = default;

bool XMLDocument::load(const QString &path)
{
    QByteArray content;
    if (const FileResult read = readWholeFile(path, content); !read) {
        m_document->reset();
        m_error = read.reason;
        return false;
    }
    return parse(content);
}

bool XMLDocument::parse(const QByteArray &xml)
{
    const unsigned options =
        m_entities == Entities::Decoded ? kParseOptions : kParseOptions & ~pugi::parse_escapes;
    const pugi::xml_parse_result result =
        m_document->load_buffer(xml.constData(), static_cast<std::size_t>(xml.size()), options);
    m_error.clear();
    if (!result) {
        m_document->reset();
        m_error = formatText(L"%s at byte %lld", result.description(), static_cast<long long>(result.offset));
    }
    return m_error.isEmpty();
}

XMLElement XMLDocument::root(const char *name) const
{
    return XMLElement(m_document->child(name).internal_object());
}

qint64 integerOfUtf8(const char *utf8) { return std::strtoll(utf8, nullptr, 10); }

QString textOfUtf8(const char *utf8, int size)
{
    constexpr int kMarkSize = static_cast<int>(sizeof kByteOrderMark) - 1;
    const bool hasMark = size >= kMarkSize && qstrncmp(utf8, kByteOrderMark, kMarkSize) == 0;
    return hasMark ? QString::fromUtf8(kByteOrderMark + QByteArray(utf8, size))
                   : QString::fromUtf8(utf8, size);
}

qint64 parseInteger(const QString &text) { return integerOfUtf8(text.toUtf8().constData()); }

double parseDecimal(const QString &text)
{
    const QByteArray digits = text.trimmed().toUtf8();
    double value = 0.0;
    std::from_chars(digits.constData(), digits.constData() + digits.size(), value);
    // "nan" and "inf" parse too, and as a file version would pass or fail every comparison.
    return std::isfinite(value) ? value : 0.0;
}
