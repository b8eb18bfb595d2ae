#include "Tests/Fixtures/VST3/ResultName.h"

#include "Tests/Fixtures/FixtureScript.h"

#include <cstdio>

using namespace Steinberg;

namespace {

const struct {
    const char *name;
    tresult result;
} kResults[] = {{"ok", kResultOk},
                {"null", kResultOk},
                {"false", kResultFalse},
                {"no-interface", kNoInterface},
                {"not-implemented", kNotImplemented},
                {"invalid-argument", kInvalidArgument},
                {"internal-error", kInternalError}};

} // namespace

tresult resultFromName(const std::string &name)
{
    for (const auto &entry : kResults) {
        if (name == entry.name)
            return entry.result;
    }
    return parseNumber(name);
}

std::string resultName(tresult result)
{
    for (const auto &entry : kResults) {
        if (result == entry.result)
            return entry.name;
    }
    char text[16] = {};
    std::snprintf(text, sizeof text, "0x%08X", static_cast<unsigned>(result));
    return text;
}
