#include "Tests/Fixtures/VST2/ScriptedEffect.h"

#include <optional>

#ifdef _WIN32
#define FIXTURE_EXPORT extern "C" __declspec(dllexport)
#else
#define FIXTURE_EXPORT extern "C" __attribute__((visibility("default")))
#endif

namespace {

/// The place of sub-plug-ins that an endless shell makes up.
const auto kMadeUp = static_cast<std::size_t>(-1);

/// Runs the script's first and last stage with the library's own start-up and shutdown code.
struct ModuleLife {
    ModuleLife()
    {
        openEffects(); // makes their list, so that it is still there at the end
        script().reach("static-constructor");
    }
    ~ModuleLife()
    {
        const std::size_t open = openEffects();
        script().reach("static-destructor", {}, open ? std::to_string(open) + " open" : "");
    }
} moduleLife;

/// A shell asks the host which of its children is wanted, as all do, without an effect; 0 is the shell
/// itself.
std::optional<FixtureSubject> wantedSubject(audioMasterCallback host)
{
    const auto &subjects = script().subjects;
    const auto id =
        isShell() ? static_cast<std::int32_t>(host(nullptr, audioMasterCurrentId, 0, 0, nullptr, 0)) : 0;
    for (const FixtureSubject &subject : subjects)
        if (subject.number == id)
            return subject;
    if (afterChildren() == "endless")
        return FixtureSubject{"Endless " + std::to_string(id), id, kMadeUp};
    script().note("entry", {}, std::to_string(id) + " unknown");
    return std::nullopt;
}

AEffect *enter(audioMasterCallback host, bool isSecondMain)
{
    if (!host)
        reportMisuse("the entry is called without a callback");
    const std::optional<FixtureSubject> subject = wantedSubject(host);
    if (!subject)
        return nullptr;
    script().reach("entry", *subject, subject->number ? std::to_string(subject->number) : "");
    AEffect *effect = makeEffect(*subject, host, isSecondMain);
    const std::string answer = script().answer("entry", *subject);
    if (answer.empty())
        return effect;
    takeBack(effect);
    return answer == "null" ? nullptr : reinterpret_cast<AEffect *>(16); // "no-memory"
}

} // namespace

// FIXTURE_ENTRIES: 1 exports VSTPluginMain, 2 main, 3 both.
#if FIXTURE_ENTRIES & 1
FIXTURE_EXPORT AEffect *VSTPluginMain(audioMasterCallback host) { return enter(host, false); }
#endif
#if FIXTURE_ENTRIES & 2
// C++ has rules for a function of this name, so only its symbol has it.
FIXTURE_EXPORT AEffect *olderEntry(audioMasterCallback host) __asm__("main");

AEffect *olderEntry(audioMasterCallback host) { return enter(host, FIXTURE_ENTRIES == 3); }
#endif
