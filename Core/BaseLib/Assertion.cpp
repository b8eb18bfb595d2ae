#include "Core/BaseLib/Assertion.h"

#include "Core/BaseLib/DebugLog.h"

void reportAssertion(const char *condition, SourcePlace place)
{
    DebugLog(L"Assertion failed: \"%s\", %s, line %d", condition, place.file, place.line);
}
