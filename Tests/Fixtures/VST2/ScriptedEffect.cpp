#include "Tests/Fixtures/VST2/PluginEntry.h"

#include "Tests/Fixtures/VST2/Opcodes.h"
#include "Tests/Fixtures/VST2/PluginScript.h"
#include "Tests/Fixtures/VST2/RepeatingThread.h"

#include <algorithm>
#include <cstring>
#include <memory>
#include <thread>
#include <utility>

namespace {

/// What stands above the 32 bits of the flags, where other compilers leave what was in memory before.
const std::int64_t kFlagsPadding = static_cast<std::int64_t>(0x5A5A5A5A00000000);
/// What the numbers of a closed effect read as.
const std::int32_t kSpoiled = static_cast<std::int32_t>(0xDDDDDDDD);

/// The host call that this thread is nesting, while it waits for the host to call back.
thread_local const HostCall *nestedCall = nullptr;
thread_local int nestedDepth = 0; ///< the calls that are still to be made

std::int32_t flagsOf(const EffectScript &script)
{
    return script.flags.value_or(effFlagsCanReplacing | (script.chunk ? effFlagsProgramChunks : 0) |
                                 (script.editor ? effFlagsHasEditor : 0));
}

void fillField(char *field, std::size_t size, const std::string &text)
{
    std::memcpy(field, text.data(), std::min(size, text.size()));
}

/// One effect that the module handed out. It stays in memory when it is closed, so that a call after that is
/// found out.
class ScriptedEffect {
public:
    ScriptedEffect(EffectScript script, FixtureSubject subject, audioMasterCallback host)
        : m_script(std::move(script))
        , m_subject(std::move(subject))
        , m_host(host)
    {
        m_effect.magic = m_script.magic;
        m_effect.dispatcher = [](AEffect *effect, int opcode, int index, VstIntPtr value, void *pointer,
                                 float opt) {
            return open(effect).dispatch(opcode, index, value, pointer, opt);
        };
        m_effect.process = processBlock;
        m_effect.setParameter = setParameterOf;
        m_effect.getParameter = parameterOf;
        m_effect.numPrograms = 1;
        m_effect.numParams =
            m_script.statedParameters.value_or(static_cast<std::int32_t>(m_script.parameters.size()));
        m_effect.numInputs = m_script.inputs;
        m_effect.numOutputs = m_script.outputs;
        m_effect.flags =
            static_cast<VstIntPtr>(kFlagsPadding | static_cast<std::uint32_t>(flagsOf(m_script)));
        m_effect.object = this;
        m_effect.uniqueID = m_script.uniqueId;
        m_effect.version = 1;
        m_effect.processReplacing = processBlock;
        m_effect.processDoubleReplacing = [](AEffect *, double **, double **, int) {};
        if (m_script.ownThread)
            m_threads.push_back(std::make_unique<RepeatingThread>([] {}));
    }
    ScriptedEffect(const ScriptedEffect &) = delete;
    ScriptedEffect &operator=(const ScriptedEffect &) = delete;

    AEffect *effect() { return &m_effect; }
    bool isClosed() const { return m_closed; }

    /// Makes the host calls that the script has for a stage.
    void askHost(const std::string &stage)
    {
        for (const HostCall &call : pluginScript().hostCalls) {
            if (call.stage == stage)
                carryOut(call);
        }
    }

    /// Ends the effect's threads and spoils what the host must not read any more.
    void close()
    {
        for (const auto &thread : m_threads)
            thread->stop();
        m_closed = true;
        m_effect.magic = kSpoiled;
        m_effect.numPrograms = m_effect.numParams = kSpoiled;
        m_effect.numInputs = m_effect.numOutputs = kSpoiled;
        m_effect.initialDelay = m_effect.uniqueID = kSpoiled;
    }

private:
    static ScriptedEffect &open(AEffect *effect)
    {
        if (!effect)
            reportMisuse("a call without an effect");
        auto &instance = *static_cast<ScriptedEffect *>(effect->object);
        if (instance.m_closed)
            reportMisuse("'" + instance.m_subject.name + "' is called after it was closed");
        return instance;
    }

    static void setParameterOf(AEffect *effect, int index, float value)
    {
        ScriptedEffect &instance = open(effect);
        ScriptedParameter *parameter = instance.parameter(index);
        if (!parameter)
            return;
        instance.reach("set-parameter", std::to_string(index) + " " + floatText(value));
        parameter->value = value;
    }

    static float parameterOf(AEffect *effect, int index)
    {
        ScriptedEffect &instance = open(effect);
        const ScriptedParameter *parameter = instance.parameter(index);
        if (!parameter)
            return 0;
        instance.reach("get-parameter", std::to_string(index));
        return parameter->value;
    }

    /// Writes to every sample of every stated channel, so that a host without room for it is found out.
    static void processBlock(AEffect *effect, float **inputs, float **outputs, int frames)
    {
        const int count = effect->numOutputs; // the stage may change it
        open(effect).reach("process", std::to_string(frames));
        for (int channel = 0; channel < count; ++channel) {
            for (int frame = 0; frame < frames; ++frame)
                outputs[channel][frame] += channel < effect->numInputs ? inputs[channel][frame] : 1.0f;
        }
    }

    void reach(const std::string &stage, const std::string &detail)
    {
        pluginScript().stages.reach(stage, m_subject, detail);
        if (m_script.newOutputs && m_script.newOutputs->stage == stage)
            m_effect.numOutputs = m_script.newOutputs->count;
        askHost(stage);
    }

    VstIntPtr dispatch(int opcode, int index, VstIntPtr value, void *pointer, float opt)
    {
        const std::string stage = stageOfOpcode(opcode);
        const bool asksParameter = stage == "get-param-name" || stage == "get-param-properties";
        if (needsPointer(opcode) && !pointer)
            reportMisuse(stage + " without a pointer");
        if (opcode == effSetChunk && value < 0)
            reportMisuse(stage + " with a negative size");
        if (asksParameter && !parameter(index))
            return 0;
        if (opcode == effShellGetNextPlugin)
            return nextChild(pointer);
        if (opcode == VstPublished::effEditIdle)
            return answerIdle();
        reach(stage, callDetail(opcode, index, value, pointer, opt));
        return pluginScript().result(stage, m_subject, handle(opcode, index, value, pointer));
    }

    VstIntPtr handle(int opcode, int index, VstIntPtr value, void *pointer)
    {
        switch (opcode) {
        case effClose:
            close();
            return 0;
        case effGetParamName:
            parameter(index)->name.writeTo(pointer);
            return 0;
        case effGetChunk:
            return chunk(pointer);
        case effSetChunk:
            m_script.chunk = std::string(static_cast<const char *>(pointer), static_cast<std::size_t>(value));
            return 0;
        case effGetPlugCategory:
            return m_script.category.value_or(kPlugCategEffect);
        case effSetSpeakerArrangement:
            return 1;
        case effEditGetRect:
            return editorRect(pointer);
        case effGetEffectName:
            m_script.name.writeTo(pointer);
            return 1;
        case effGetVendorString:
            m_script.vendor.writeTo(pointer);
            return 1;
        case VstPublished::effGetParameterProperties:
            return properties(*parameter(index), pointer);
        case effGetVstVersion:
            return kVstVersion;
        default:
            return 0;
        }
    }

    /// What comes after the listed children is not in the trace and no stage: a host that never stops asking
    /// would fill the disk.
    VstIntPtr nextChild(void *pointer)
    {
        const PluginScript &plugin = pluginScript();
        const std::size_t position = m_listed++;
        if (position < plugin.children.size())
            return listChild(plugin.children[position], pointer);
        if (plugin.afterChildren == PluginScript::AfterChildren::Repeat && !plugin.children.empty()) {
            const ScriptedChild &child = plugin.children[position % plugin.children.size()];
            child.listedName.writeTo(pointer);
            return child.id;
        }
        if (plugin.afterChildren == PluginScript::AfterChildren::Endless) {
            const auto id = static_cast<std::int32_t>(1000000 + position);
            plugin.childWithId(id)->listedName.writeTo(pointer);
            return id;
        }
        m_listed = 0;
        reach("shell-next", "end");
        return plugin.result("shell-next", m_subject, 0);
    }

    VstIntPtr listChild(const ScriptedChild &child, void *pointer)
    {
        const FixtureSubject subject(child.listedName.bytes, child.id);
        pluginScript().stages.reach("shell-next", subject);
        askHost("shell-next");
        child.listedName.writeTo(pointer);
        return pluginScript().result("shell-next", subject, child.id);
    }

    VstIntPtr chunk(void *pointer) const
    {
        if (!m_script.chunk)
            return 0;
        const char *data = m_script.nullChunk ? nullptr : m_script.chunk->data();
        *static_cast<const void **>(pointer) = data;
        return static_cast<VstIntPtr>(m_script.chunk->size());
    }

    VstIntPtr editorRect(void *pointer)
    {
        if (!m_script.editor)
            return 0;
        m_editor = {0, 0, static_cast<short>(m_script.editor->height),
                    static_cast<short>(m_script.editor->width)};
        *static_cast<ERect **>(pointer) = &m_editor;
        return 1;
    }

    VstIntPtr properties(const ScriptedParameter &parameter, void *pointer) const
    {
        if (!parameter.label)
            return 0;
        auto &target = *static_cast<VstPublished::VstParameterProperties *>(pointer);
        target = {};
        fillField(target.label, sizeof target.label, *parameter.label);
        fillField(target.shortLabel, sizeof target.shortLabel, *parameter.label);
        return 1;
    }

    /// The parameter at an index, or null.
    ScriptedParameter *parameter(int index)
    {
        const bool exists = index >= 0 && static_cast<std::size_t>(index) < m_script.parameters.size();
        return exists ? &m_script.parameters[static_cast<std::size_t>(index)] : nullptr;
    }

    void carryOut(const HostCall &call)
    {
        const auto callOnce = [this, &call] { call.answer(m_host, &m_effect); };
        switch (call.caller) {
        case HostCall::Caller::SameThread:
            return askAtDepth(call, call.depth);
        case HostCall::Caller::OtherThread:
            return std::thread([this, &call] { askAtDepth(call, call.depth); }).join();
        case HostCall::Caller::UntilClose:
            askFrom(call);
            m_threads.push_back(std::make_unique<RepeatingThread>(callOnce));
            return;
        }
    }

    void askFrom(const HostCall &call)
    {
        pluginScript().stages.note(call.traceName(), m_subject, call.answer(m_host, &m_effect));
    }

    /// Nests by way of the idle call, which the host hands back to the effect.
    void askAtDepth(const HostCall &call, int depth)
    {
        if (depth == 1)
            return askFrom(call);
        nestedCall = &call;
        nestedDepth = depth - 1;
        m_host(&m_effect, VstPublished::audioMasterIdle, 0, 0, nullptr, 0);
        if (nestedCall)
            pluginScript().stages.note(call.traceName(), m_subject, "not reached");
        nestedCall = nullptr;
    }

    VstIntPtr answerIdle()
    {
        // Taken first: a fault that this stage commits ends the nesting.
        const HostCall *call = std::exchange(nestedCall, nullptr);
        const int depth = nestedDepth;
        reach("edit-idle", {});
        if (call)
            askAtDepth(*call, depth);
        return pluginScript().result("edit-idle", m_subject, 0);
    }

    EffectScript m_script;
    FixtureSubject m_subject;
    audioMasterCallback m_host;
    AEffect m_effect = {};
    ERect m_editor = {};
    bool m_closed = false;
    std::size_t m_listed = 0; ///< children listed since the enumeration began
    std::vector<std::unique_ptr<RepeatingThread>> m_threads;
};

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
