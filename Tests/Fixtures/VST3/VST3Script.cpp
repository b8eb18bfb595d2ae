#include "Tests/Fixtures/VST3/VST3Script.h"

#include <map>

using namespace Steinberg;

namespace {

FixtureScript readScript()
{
    FixtureScript read({"class", false,
                        "category subcategories vendor version controller state stated-inputs stated-outputs "
                        "inputs outputs id",
                        "factory-vendor generation",
                        "static-constructor module-entry get-factory set-host-context factory-info "
                        "count-classes class-info class-info2 class-info-unicode create-instance set-io-mode "
                        "initialize controller-class-id set-component-handler connect get-state "
                        "set-component-state set-state disconnect bus-count bus-info terminate release "
                        "factory-release module-exit static-destructor"});
    if (!read.exists)
        read.subjects.push_back({read.subjects[0].name, 0, 1});
    return read;
}

/// FNV-1a.
std::uint64_t hashOf(const std::string &text, std::uint64_t hash)
{
    for (const char character : text)
        hash = (hash ^ static_cast<unsigned char>(character)) * 0x100000001B3u;
    return hash;
}

} // namespace

const FixtureScript &script()
{
    static const FixtureScript script = readScript();
    return script;
}

std::string textOf(const FixtureSubject &described, const char *key, const char *usual)
{
    return script().text(key, described.place, usual);
}

tresult resultAt(const std::string &stage, const FixtureSubject &subject)
{
    static const std::map<std::string, tresult> names = {{"", kResultOk},
                                                         {"ok", kResultOk},
                                                         {"null", kResultOk},
                                                         {"false", kResultFalse},
                                                         {"no-interface", kNoInterface},
                                                         {"internal-error", kInternalError}};
    const std::string answer = script().answer(stage, subject);
    const auto named = names.find(answer);
    return named != names.end() ? named->second : numberOf(answer);
}

FUID idOf(const FixtureSubject &described)
{
    FUID id;
    const std::string digits = textOf(described, "id");
    if (digits.empty()) {
        const std::uint64_t first = hashOf(described.name, 0xCBF29CE484222325u);
        const std::uint64_t second = hashOf(described.name, first);
        id = FUID(static_cast<uint32>(first >> 32), static_cast<uint32>(first),
                  static_cast<uint32>(second >> 32), static_cast<uint32>(second));
    } else if (digits.size() != 32 || !id.fromString(digits.c_str())) {
        reportMisuse("an id has 32 hexadecimal digits");
    }
    return id;
}
