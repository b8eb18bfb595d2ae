#include "Main/AudioEngineController/Effects/VST/Interface/VSTEffect.h"

#include "Core/BaseLib/Log/Assertion.h"
#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/FaultGuard.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTCallbackNesting.h"

#include <algorithm>
#include <cstring>
#include <limits>

namespace {

/// Room behind a text buffer for plug-ins that write more than they may; none of it is read.
constexpr int kSlack = 4096;
/// The index that asks for the chunk of the current program, not of the whole bank.
constexpr VstInt32 kOfProgram = 1;
/// Memory of a plug-in is taken over in steps of this many bytes: a size that a plug-in only claims is not
/// believed before it was read.
constexpr int kCopyStep = 1 << 20;

/// The text in the first `size` bytes of a buffer.
QByteArray textIn(const QByteArray &buffer, int size)
{
    return buffer.left(static_cast<int>(strnlen(buffer.constData(), static_cast<std::size_t>(size))));
}

/// Copies byte by byte. What a plug-in names as its own may lie anywhere in the process, so the sanitizers
/// have no say in it; where nothing is mapped, the guard around catches the fault.
__attribute__((no_sanitize_address, no_sanitize_thread)) void copyBytes(char *target,
                                                                        const volatile char *source, int size)
{
    for (int index = 0; index < size; ++index)
        target[index] = source[index];
}

/// A copy of a plug-in's memory; null when it cannot be read to its end or is more than a byte array holds.
QByteArray copyOf(const void *memory, VstIntPtr size)
{
    const auto *source = static_cast<const char *>(memory);
    QByteArray copy("");
    try {
        while (copy.size() < size) {
            const int done = copy.size();
            const int step = static_cast<int>(std::min<VstIntPtr>(kCopyStep, size - done));
            if (step > std::numeric_limits<int>::max() - kSlack - done)
                return QByteArray();
            copy.resize(done + step);
            callGuarded([&, target = copy.data() + done] { copyBytes(target, source + done, step); });
        }
    } catch (const std::exception &error) { // no such memory, of theirs or of ours
        DebugLog(L"%lld bytes of the plug-in cannot be read: %s", static_cast<long long>(size), error.what());
        return QByteArray();
    }
    return copy;
}

} // namespace

bool vstExceptionFilter(quint32 code)
{
    DebugLog(L"VST Exception Filter: code = 0x%X", code);
    return code == FaultCode::kAccessViolation;
}

std::optional<VSTEffect::Fields> VSTEffect::fields() const
{
    if (!m_plugin)
        return std::nullopt;
    Fields fields = {};
    try {
        callGuarded([&] {
            const volatile AEffect &effect = *m_plugin;
            fields.magic = effect.magic;
            fields.flags = static_cast<VstInt32>(effect.flags);
            fields.numPrograms = effect.numPrograms;
            fields.numParams = effect.numParams;
            fields.numInputs = effect.numInputs;
            fields.numOutputs = effect.numOutputs;
            fields.initialDelay = effect.initialDelay;
            fields.uniqueID = effect.uniqueID;
        });
    } catch (const SEException &fault) {
        if (!vstExceptionFilter(fault.code()))
            throw; // nothing that reading does: for the guards around
        return std::nullopt;
    }
    return fields;
}

bool VSTEffect::isEffect() const
{
    const std::optional<Fields> read = fields();
    return read && read->magic == kEffectMagic;
}

bool VSTEffect::setOwner(IVSTEffectOwner *owner)
{
    try {
        callGuarded([&] { m_plugin->resvd1 = reinterpret_cast<VstIntPtr>(owner); });
        return true;
    } catch (const SEException &fault) {
        *m_faulted = true;
        DebugLog(L"%ls: its effect cannot be written to: %s", m_path, fault.what());
    }
    return false;
}

VstIntPtr VSTEffect::dispatch(VstInt32 opcode) { return call(opcode, 0, 0, nullptr, 0.0f).value_or(0); }

VstIntPtr VSTEffect::dispatch(VstInt32 opcode, void *pointer)
{
    DebugTrace(L"VST Plugin Dispatch(%d,%p);", opcode, pointer);
    return call(opcode, 0, 0, pointer, 0.0f).value_or(0);
}

VstIntPtr VSTEffect::dispatchValue(VstInt32 opcode, VstIntPtr value)
{
    DebugTrace(L"VST Plugin Dispatch(%d,%d);", opcode, static_cast<VstInt32>(value));
    return call(opcode, 0, value, nullptr, 0.0f).value_or(0);
}

VstIntPtr VSTEffect::dispatchFloat(VstInt32 opcode, float number)
{
    DebugTrace(L"VST Plugin Dispatch(%d,%f);", opcode, static_cast<double>(number));
    return call(opcode, 0, 0, nullptr, number).value_or(0);
}

bool VSTEffect::send(VstInt32 opcode)
{
    if (isCallable())
        dispatch(opcode);
    return isCallable();
}

bool VSTEffect::sendValue(VstInt32 opcode, VstIntPtr value)
{
    if (isCallable())
        dispatchValue(opcode, value);
    return isCallable();
}

std::optional<VstIntPtr> VSTEffect::dispatchAt(VstInt32 opcode, VstInt32 index, VstIntPtr value,
                                               void *pointer)
{
    return call(opcode, index, value, pointer, 0.0f);
}

VSTEffect::Text VSTEffect::dispatchText(VstInt32 opcode, int size)
{
    QByteArray buffer(size + kSlack, '\0');
    const VstIntPtr answer = dispatch(opcode, buffer.data());
    return {answer, textIn(buffer, size)};
}

QByteArray VSTEffect::textAt(VstInt32 opcode, VstInt32 index, int size)
{
    QByteArray buffer(size + kSlack, '\0');
    return dispatchAt(opcode, index, 0, buffer.data()) ? textIn(buffer, size) : QByteArray();
}

QByteArray VSTEffect::parameterProperties(VstInt32 index)
{
    QByteArray buffer(static_cast<int>(sizeof(VstPublished::VstParameterProperties)) + kSlack, '\0');
    const auto answer = dispatchAt(VstPublished::effGetParameterProperties, index, 0, buffer.data());
    return answer.value_or(0) != 0 ? buffer : QByteArray();
}

/// Makes one call into the plug-in; false, with a log line, when it failed.
template <typename Call>
bool VSTEffect::guard(const char *what, int number, Call &&call)
{
    const AEffect *const _plugin = m_plugin;
    if (!FXPROBE_VERIFY(0 != _plugin))
        return false;
    const auto nesting = VSTCallbackNesting::keep();
    try {
        callGuarded(call);
        return true;
    } catch (const SEException &fault) {
        *m_faulted = true;
        DebugLog(L"%ls: %s %d: %s, %ls", m_path, what, number, fault.what(), fault.words());
    } catch (...) {
        DebugLog(L"%ls: %s %d %ls", m_path, what, number, guardedThrownText());
    }
    return false;
}

std::optional<VstIntPtr> VSTEffect::call(VstInt32 opcode, VstInt32 index, VstIntPtr value, void *pointer,
                                         float number)
{
    VstIntPtr answer = 0;
    const bool answered = guard("call", opcode, [&] {
        answer = m_plugin->dispatcher(m_plugin, opcode, index, value, pointer, number);
    });
    return answered ? std::make_optional(answer) : std::nullopt;
}

std::optional<float> VSTEffect::parameter(VstInt32 index)
{
    std::optional<float> value;
    guard("parameter", index, [&] {
        if (m_plugin->getParameter)
            value = m_plugin->getParameter(m_plugin, index);
    });
    return value;
}

bool VSTEffect::setParameter(VstInt32 index, float value)
{
    bool set = false;
    guard("parameter", index, [&] {
        set = m_plugin->setParameter != nullptr;
        if (set)
            m_plugin->setParameter(m_plugin, index, value);
    });
    return set;
}

bool VSTEffect::process(ChannelBuffers &buffers, VstInt32 frames)
{
    const auto inputs = static_cast<VstInt32>(buffers.inputCount());
    const auto outputs = static_cast<VstInt32>(buffers.outputCount());
    bool processed = false;
    const bool returned = guard("block of", frames, [&] {
        // The older function adds to what is in the outputs, which are silent.
        const bool replaces = (m_plugin->flags & effFlagsCanReplacing) != 0;
        const AEffectProcessProc function = replaces ? m_plugin->processReplacing : m_plugin->process;
        processed = function && m_plugin->numInputs <= inputs && m_plugin->numOutputs <= outputs;
        if (processed)
            function(m_plugin, buffers.inputs(), buffers.outputs(), frames);
    });
    if (!returned)
        DebugLog(L"Exception Caught in VST Plugin");
    return returned && processed;
}

std::optional<QRect> VSTEffect::editorRect()
{
    ERect *stated = nullptr;
    if (!dispatchAt(effEditGetRect, 0, 0, &stated) || !stated)
        return std::nullopt;
    ERect rect = {};
    const QByteArray copy = copyOf(stated, sizeof rect);
    if (copy.isNull())
        return std::nullopt;
    std::memcpy(&rect, copy.constData(), sizeof rect);
    return QRect(QPoint(rect.left, rect.top), QPoint(rect.right - 1, rect.bottom - 1));
}

VSTEffect::Chunk VSTEffect::programChunk()
{
    void *data = nullptr;
    const VstIntPtr answer = dispatchAt(effGetChunk, kOfProgram, 0, &data).value_or(0);
    if (answer < 2 || !data)
        return {answer, QByteArray()};
    return {answer, copyOf(data, answer)};
}

VstIntPtr VSTEffect::dispatchUnguarded(AEffect *effect, VstInt32 opcode)
{
    return effect->dispatcher(effect, opcode, 0, 0, nullptr, 0.0f);
}
