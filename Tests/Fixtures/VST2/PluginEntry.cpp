#include "Tests/Fixtures/VST2/PluginEntry.h"

#include "Tests/Fixtures/FixtureMisuse.h"
#include "Tests/Fixtures/VST2/ScriptedEffect.h"

#include <algorithm>
#include <memory>
#include <vector>

namespace {

/// What the module handed out, for the module's life.
std::vector<std::unique_ptr<ScriptedEffect>> &handedOut()
{
    static std::vector<std::unique_ptr<ScriptedEffect>> effects;
    return effects;
}

/// Runs the script's first and last stage with the library's own start-up and shutdown code.
struct ModuleLife {
    ModuleLife()
    {
        handedOut(); // made first, so that they are still there at the end
        pluginScript().stages.reach("static-constructor");
    }
    ~ModuleLife()
    {
        const auto open = std::count_if(handedOut().begin(), handedOut().end(),
                                        [](const auto &effect) { return !effect->isClosed(); });
        pluginScript().stages.reach("static-destructor", {}, open ? std::to_string(open) + " open" : "");
    }
} moduleLife;

/// What the host asks for.
struct Request {
    EffectScript effect;
    FixtureSubject subject;
    std::string detail; ///< for the trace
};

/// A shell asks the host which of its children is wanted, as all do, without an effect; 0 is the shell
/// itself.
std::optional<Request> readRequest(audioMasterCallback host)
{
    const PluginScript &plugin = pluginScript();
    const auto id = plugin.isShell()
                        ? static_cast<std::int32_t>(host(nullptr, audioMasterCurrentId, 0, 0, nullptr, 0))
                        : 0;
    if (id == 0) {
        Request request = {plugin.effect, plugin.subject(), {}};
        if (plugin.isShell() && !request.effect.category)
            request.effect.category = kPlugCategShell;
        return request;
    }
    const std::optional<ScriptedChild> child = plugin.childWithId(id);
    if (!child) {
        plugin.stages.note("entry", {}, std::to_string(id) + " unknown");
        return std::nullopt;
    }
    return Request{child->effect, FixtureSubject(child->listedName.bytes, id), std::to_string(id)};
}

void renameForSecondMain(EffectScript &effect)
{
    effect.name.bytes += " by main";
    effect.uniqueId = static_cast<std::int32_t>(static_cast<std::uint32_t>(effect.uniqueId) + 1);
}

/// Takes the effect back where the script has no effect as the answer.
AEffect *answerOf(const FixtureSubject &subject, ScriptedEffect &effect)
{
    const std::string *answer = pluginScript().stages.answer("entry", subject);
    if (!answer)
        return effect.effect();
    if (*answer != "null" && *answer != "no-memory")
        reportMisuse("the entry cannot answer '" + *answer + "'");
    const bool null = *answer == "null";
    effect.close();
    return null ? nullptr : reinterpret_cast<AEffect *>(16);
}

} // namespace

AEffect *enterPlugin(audioMasterCallback host, EntryPoint entryPoint)
{
    if (!host)
        reportMisuse("the entry is called without a callback");
    std::optional<Request> request = readRequest(host);
    if (!request)
        return nullptr;
    pluginScript().stages.reach("entry", request->subject, request->detail);
    if (entryPoint == EntryPoint::SecondMain)
        renameForSecondMain(request->effect);
    auto &effects = handedOut();
    effects.push_back(std::make_unique<ScriptedEffect>(request->effect, request->subject, host));
    ScriptedEffect &made = *effects.back();
    made.askHost("entry");
    return answerOf(request->subject, made);
}
