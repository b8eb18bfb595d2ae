#include "Main/AudioEngineController/Effects/Catalogue/ElementContent.h"

#include <QByteArray>

ElementContent ElementContent::child(const char *name) const
{
    if (m_element)
        return ElementContent(m_element.child(name));
    const QByteArray content = QByteArray::fromRawData(m_utf8, m_size);
    const QByteArray tag = QByteArray(name) + '>';
    const int start = content.indexOf("\t\t\t<" + tag);
    const int end = content.lastIndexOf("</" + tag);
    const int from = start + 4 + tag.size();
    if (start < 0 || end < from)
        return {};
    return {m_utf8 + from, end - from};
}
