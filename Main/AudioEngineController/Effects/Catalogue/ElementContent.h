#pragma once

#include "Core/BaseLib/Files/XMLDocument.h"

/// What one element of a catalogue record holds, read by an XML reader or by the lines of the file. A view:
/// valid as long as the document, or the text of the file. A default-constructed one holds nothing.
class ElementContent {
public:
    ElementContent() = default;
    explicit ElementContent(const XMLElement &element)
        : m_element(element)
        , m_utf8(element.utf8())
        , m_size(static_cast<int>(qstrlen(m_utf8)))
    {}
    /// The bytes between an element's tags as they stand in the file.
    ElementContent(const char *utf8, int size)
        : m_utf8(utf8)
        , m_size(size)
    {}

    QString text() const { return textOfUtf8(m_utf8, m_size); }
    /// The text as `parseInteger` reads it.
    qint64 integer() const { return integerOfUtf8(m_utf8); }
    /// The first element of that name inside this one.
    ElementContent child(const char *name) const;

private:
    XMLElement m_element; ///< none when it was read by lines
    const char *m_utf8 = "";
    int m_size = 0;
};
