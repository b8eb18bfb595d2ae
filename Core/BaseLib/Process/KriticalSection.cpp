#include "Core/BaseLib/Process/KriticalSection.h"

#include "Core/BaseLib/Log/Assertion.h"

#include <QDebug>

TAutoLockCS::TAutoLockCS(KriticalSection *section)
{
    if (!section) {
        reportAssertion("0", SourcePlace{"Core/BaseLib/KriticalSection", 194});
        qDebug(" TAutoLockCS given a null pointer\n");
        return;
    }
    if (!section->useLock())
        return;
    section->enter();
    m_entered = section;
}

TAutoLockCS::~TAutoLockCS()
{
    if (m_entered)
        m_entered->leave();
}
