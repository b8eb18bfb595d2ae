#include "Main/AudioEngineController/Effects/VST/VSTEffect.h"

#include "Core/BaseLib/Assertion.h"
#include "Core/BaseLib/DebugLog.h"
#include "Core/BaseLib/FaultGuard.h"
#include "Main/AudioEngineController/Effects/VST/VSTHostCallback.h"

#include <cstring>

namespace {

/// Room behind a text buffer for plug-ins that write more than they may; none of it is read.
constexpr int kSlack = 4096;

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

void VSTEffect::setOwner(void *owner)
{
    callGuarded([&] { m_plugin->resvd1 = reinterpret_cast<VstIntPtr>(owner); });
}

VstIntPtr VSTEffect::dispatch(VstInt32 opcode) { return call(opcode, 0, nullptr, 0.0f); }

VstIntPtr VSTEffect::dispatch(VstInt32 opcode, void *pointer)
{
    DebugTrace(L"VST Plugin Dispatch(%d,%p);", opcode, pointer);
    return call(opcode, 0, pointer, 0.0f);
}

VstIntPtr VSTEffect::dispatchValue(VstInt32 opcode, VstIntPtr value)
{
    DebugTrace(L"VST Plugin Dispatch(%d,%d);", opcode, static_cast<VstInt32>(value));
    return call(opcode, value, nullptr, 0.0f);
}

VstIntPtr VSTEffect::dispatchFloat(VstInt32 opcode, float number)
{
    DebugTrace(L"VST Plugin Dispatch(%d,%f);", opcode, static_cast<double>(number));
    return call(opcode, 0, nullptr, number);
}

VSTEffect::Text VSTEffect::dispatchText(VstInt32 opcode, int size)
{
    QByteArray buffer(size + kSlack, '\0');
    const VstIntPtr answer = dispatch(opcode, buffer.data());
    const std::size_t length = strnlen(buffer.constData(), static_cast<std::size_t>(size));
    return {answer, buffer.left(static_cast<int>(length))};
}

VstIntPtr VSTEffect::call(VstInt32 opcode, VstIntPtr value, void *pointer, float number)
{
    const AEffect *const _plugin = m_plugin;
    if (!FXPROBE_VERIFY(0 != _plugin))
        return 0;
    const VSTCallbackNesting::Restore nesting;
    try {
        return callGuarded([&] { return m_plugin->dispatcher(m_plugin, opcode, 0, value, pointer, number); });
    } catch (const SEException &fault) {
        m_faulted = true;
        DebugLog(L"VST plug-in call %d: %s", opcode, fault.what());
    } catch (const std::exception &exception) {
        DebugLog(L"VST plug-in call %d threw: %ls", opcode, guardedText(exception));
    } catch (...) {
        DebugLog(L"VST plug-in call %d threw something that is no standard exception", opcode);
    }
    return 0;
}

VstIntPtr VSTEffect::dispatchUnguarded(AEffect *effect, VstInt32 opcode)
{
    return effect->dispatcher(effect, opcode, 0, 0, nullptr, 0.0f);
}
