#include "Tests/Fixtures/VST2/ScriptedEffect.h"

#include "Tests/Fixtures/FixtureMisuse.h"
#include "Tests/Fixtures/VST2/Opcodes.h"

#include <algorithm>
#include <cstring>
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

void processNothingDouble(AEffect *, double **, double **, int) {}

std::int32_t flagsOf(const EffectScript &script)
{
    return script.flags.value_or(effFlagsCanReplacing | (script.chunk ? effFlagsProgramChunks : 0) |
                                 (script.editor ? effFlagsHasEditor : 0));
}

void fillField(char *field, std::size_t size, const std::string &text)
{
    std::memcpy(field, text.data(), std::min(size, text.size()));
}

} // namespace

ScriptedEffect::ScriptedEffect(EffectScript script, FixtureSubject subject, audioMasterCallback host)
    : m_script(std::move(script))
    , m_subject(std::move(subject))
    , m_host(host)
{
    m_effect.magic = m_script.magic;
    m_effect.dispatcher = dispatchTo;
    m_effect.process = processBlock;
    m_effect.setParameter = setParameterOf;
    m_effect.getParameter = parameterOf;
    m_effect.numPrograms = 1;
    m_effect.numParams =
        m_script.statedParameters.value_or(static_cast<std::int32_t>(m_script.parameters.size()));
    m_effect.numInputs = m_script.inputs;
    m_effect.numOutputs = m_script.outputs;
    m_effect.flags = static_cast<VstIntPtr>(kFlagsPadding | static_cast<std::uint32_t>(flagsOf(m_script)));
    m_effect.object = this;
    m_effect.uniqueID = m_script.uniqueId;
    m_effect.version = 1;
    m_effect.processReplacing = processBlock;
    m_effect.processDoubleReplacing = processNothingDouble;
    if (m_script.ownThread)
        m_threads.push_back(std::make_unique<RepeatingThread>([] {}));
}

void ScriptedEffect::close()
{
    for (const auto &thread : m_threads)
        thread->stop();
    m_closed = true;
    m_effect.magic = kSpoiled;
    m_effect.numPrograms = m_effect.numParams = kSpoiled;
    m_effect.numInputs = m_effect.numOutputs = kSpoiled;
    m_effect.initialDelay = m_effect.uniqueID = kSpoiled;
}

ScriptedEffect &ScriptedEffect::open(AEffect *effect)
{
    if (!effect)
        reportMisuse("a call without an effect");
    auto &instance = *static_cast<ScriptedEffect *>(effect->object);
    if (instance.m_closed)
        reportMisuse("'" + instance.m_subject.name + "' is called after it was closed");
    return instance;
}

VstIntPtr ScriptedEffect::dispatchTo(AEffect *effect, int opcode, int index, VstIntPtr value, void *pointer,
                                     float opt)
{
    return open(effect).dispatch(opcode, index, value, pointer, opt);
}

void ScriptedEffect::setParameterOf(AEffect *effect, int index, float value)
{
    ScriptedEffect &instance = open(effect);
    ScriptedParameter *parameter = instance.parameter(index);
    if (!parameter)
        return;
    instance.reach("set-parameter", std::to_string(index) + " " + floatText(value));
    parameter->value = value;
}

float ScriptedEffect::parameterOf(AEffect *effect, int index)
{
    ScriptedEffect &instance = open(effect);
    const ScriptedParameter *parameter = instance.parameter(index);
    if (!parameter)
        return 0;
    instance.reach("get-parameter", std::to_string(index));
    return parameter->value;
}

/// Writes to every sample of every stated channel, so that a host without room for it is found out.
void ScriptedEffect::processBlock(AEffect *effect, float **inputs, float **outputs, int frames)
{
    const int count = effect->numOutputs; // the stage may change it
    open(effect).reach("process", std::to_string(frames));
    for (int channel = 0; channel < count; ++channel) {
        for (int frame = 0; frame < frames; ++frame)
            outputs[channel][frame] += channel < effect->numInputs ? inputs[channel][frame] : 1.0f;
    }
}

void ScriptedEffect::reach(const std::string &stage, const std::string &detail)
{
    pluginScript().stages.reach(stage, m_subject, detail);
    if (m_script.newOutputs && m_script.newOutputs->stage == stage)
        m_effect.numOutputs = m_script.newOutputs->count;
    askHost(stage);
}

VstIntPtr ScriptedEffect::dispatch(int opcode, int index, VstIntPtr value, void *pointer, float opt)
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

VstIntPtr ScriptedEffect::handle(int opcode, int index, VstIntPtr value, void *pointer)
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
VstIntPtr ScriptedEffect::nextChild(void *pointer)
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

VstIntPtr ScriptedEffect::listChild(const ScriptedChild &child, void *pointer)
{
    const FixtureSubject subject(child.listedName.bytes, child.id);
    pluginScript().stages.reach("shell-next", subject);
    askHost("shell-next");
    child.listedName.writeTo(pointer);
    return pluginScript().result("shell-next", subject, child.id);
}

VstIntPtr ScriptedEffect::chunk(void *pointer) const
{
    if (!m_script.chunk)
        return 0;
    const char *data = m_script.nullChunk ? nullptr : m_script.chunk->data();
    *static_cast<const void **>(pointer) = data;
    return static_cast<VstIntPtr>(m_script.chunk->size());
}

VstIntPtr ScriptedEffect::editorRect(void *pointer)
{
    if (!m_script.editor)
        return 0;
    m_editor = {0, 0, static_cast<short>(m_script.editor->height),
                static_cast<short>(m_script.editor->width)};
    *static_cast<ERect **>(pointer) = &m_editor;
    return 1;
}

VstIntPtr ScriptedEffect::properties(const ScriptedParameter &parameter, void *pointer) const
{
    if (!parameter.label)
        return 0;
    auto &target = *static_cast<VstPublished::VstParameterProperties *>(pointer);
    target = {};
    fillField(target.label, sizeof target.label, *parameter.label);
    fillField(target.shortLabel, sizeof target.shortLabel, *parameter.label);
    return 1;
}

ScriptedParameter *ScriptedEffect::parameter(int index)
{
    const bool exists = index >= 0 && static_cast<std::size_t>(index) < m_script.parameters.size();
    return exists ? &m_script.parameters[static_cast<std::size_t>(index)] : nullptr;
}

void ScriptedEffect::askHost(const std::string &stage)
{
    for (const HostCall &call : pluginScript().hostCalls) {
        if (call.stage == stage)
            carryOut(call);
    }
}

void ScriptedEffect::carryOut(const HostCall &call)
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

void ScriptedEffect::askFrom(const HostCall &call)
{
    pluginScript().stages.note(call.traceName(), m_subject, call.answer(m_host, &m_effect));
}

/// Nests by way of the idle call, which the host hands back to the effect.
void ScriptedEffect::askAtDepth(const HostCall &call, int depth)
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

VstIntPtr ScriptedEffect::answerIdle()
{
    // Taken first: a fault that this stage commits ends the nesting.
    const HostCall *call = std::exchange(nestedCall, nullptr);
    const int depth = nestedDepth;
    reach("edit-idle", {});
    if (call)
        askAtDepth(*call, depth);
    return pluginScript().result("edit-idle", m_subject, 0);
}
