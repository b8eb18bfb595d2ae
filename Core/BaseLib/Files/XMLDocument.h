#pragma once

#include <QByteArray>
#include <QString>

#include <memory>
#include <optional>
#include <vector>

namespace pugi {
class xml_document;
struct xml_node_struct;
} // namespace pugi

/// One element of an `XMLDocument`; valid as long as the document. A default-constructed element stands for
/// one that does not exist: it has no text, no attributes and no children.
class XMLElement {
public:
    XMLElement() = default;

    explicit operator bool() const { return m_node != nullptr; }
    /// The first child element of that name.
    XMLElement child(const char *name) const;
    /// All child elements of that name, in document order.
    std::vector<XMLElement> children(const char *name) const;
    /// The element's text; empty when there is none.
    QString text() const;
    /// The same as UTF-8; never null, valid as long as the document.
    const char *utf8() const;
    /// The element's text as `parseInteger` reads it; 0 when there is none.
    qint64 integer() const;
    /// An attribute's value; nothing when the attribute is absent.
    std::optional<QString> attribute(const char *name) const;

private:
    friend class XMLDocument;
    explicit XMLElement(pugi::xml_node_struct *node)
        : m_node(node)
    {}

    pugi::xml_node_struct *m_node = nullptr;
};

/// An XML file held in memory, queried by element name.
class XMLDocument {
public:
    /// How "&amp;" and its like are read: as the characters that they stand for, or as they stand, for files
    /// whose writers escape nothing.
    enum class Entities { Decoded, Literal };

    explicit XMLDocument(Entities entities = Entities::Decoded);
    ~XMLDocument();
    XMLDocument(const XMLDocument &) = delete;
    XMLDocument &operator=(const XMLDocument &) = delete;

    /// Reads and parses a file. False when it cannot be read or is not well-formed; `error` then says why
    /// and the document is empty.
    bool load(const QString &path);
    /// Parses a text held in memory.
    bool parse(const QByteArray &xml);
    /// Why the last load failed, in one phrase; empty after a success.
    const QString &error() const { return m_error; }

    /// The top element of that name.
    XMLElement root(const char *name) const;

private:
    Entities m_entities;
    std::unique_ptr<pugi::xml_document> m_document;
    QString m_error;
};

/// An integer as in the catalogue files: base 10, a sign allowed, trailing junk ignored; 0 for a text that is
/// not a number, and the nearest limit for a number that does not fit 64 bits.
qint64 parseInteger(const QString &text);
/// The same of text that a null character, or anything that is not part of a number, follows.
qint64 integerOfUtf8(const char *utf8);
/// A text with all its characters: Qt drops a byte order mark at its start.
QString textOfUtf8(const char *utf8, int size);
/// A decimal number, read the same in every locale; 0 for a text that is not a number.
double parseDecimal(const QString &text);
