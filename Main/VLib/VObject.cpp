#include "Main/VLib/VObject.h"

#include "Core/BaseLib/Log/Assertion.h"

int VObject::compare(const VObject &other) const
{
    reportAssertion("0", SourcePlace{"Main/VLib/VObject", 273});
    if (m_identifier == other.m_identifier)
        return 0;
    return m_identifier < other.m_identifier ? -1 : 1;
}
