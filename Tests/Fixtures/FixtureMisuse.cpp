#include "Tests/Fixtures/FixtureMisuse.h"

#include "Tests/Fixtures/FixturePlatform.h"

#include <cstdio>

void reportMisuse(const std::string &reason)
{
    std::fprintf(stderr, "fixture misused: %s: %s\n", modulePath().c_str(), reason.c_str());
    std::fflush(stderr);
    endProcess(kFixtureMisused);
}
