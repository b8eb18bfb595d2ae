#include "Core/BaseLib/Log/Assertion.h"

#include "Core/BaseLib/Log/DebugLog.h"

void reportAssertion(const char *condition, SourcePlace place)
{
    DebugLog(L"Assertion failed: \"%s\", %s, line %d", condition, place.file, place.line);
}
