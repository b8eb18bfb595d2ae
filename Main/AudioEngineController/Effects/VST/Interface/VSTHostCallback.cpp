#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostCallback.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/Interface/IVSTEffectOwner.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTCallbackNesting.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTEffect.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostContext.h"

#include <cstring>

namespace {

namespace vst = VstPublished;

constexpr VstIntPtr kHostVstVersion = 2400;
constexpr VstIntPtr kAutomatableParameters = 8192;
constexpr char kHostVendor[] = "Tessel";
constexpr char kHostProduct[] = "Vantage II";

/// In the order in which they are compared. The two file selectors stand here although their opcodes are not
/// served: plug-ins in the field expect both.
constexpr const char *kCapabilities[] = {
    "sendVstEvents",   "sendVstMidiEvent", "shellCategory",    "sendVstMidiEventFlagIsRealtime",
    "sendVstTimeInfo", "startStopProcess", "openFileSelector", "closeFileSelector",
    "supplyIdle",      "sizeWindow"};

/// One call of the callback while it is answered.
struct HostCall {
    VSTHostContext &context;
    AEffect *effect;
    VstInt32 opcode;
    VstInt32 index;
    VstIntPtr value;
    void *ptr;
    float opt;

    /// Lets the owner of the calling plug-in do something, if there is one; says whether there was.
    template <typename Operation>
    bool withOwner(Operation &&operation) const
    {
        return context.withOwner(effect, operation);
    }
};

/// What a call is answered with. A direct answer leaves no trace line.
struct Answer {
    VstIntPtr value = 0;
    bool direct = false;
};

Answer currentId(const HostCall &call)
{
    VstInt32 id = 0;
    if (const IVSTEffectOwner *loading = call.context.ownerBeingLoaded())
        id = loading->shellId();
    else
        call.withOwner([&](const IVSTEffectOwner &owner) { id = owner.shellId(); });
    return {id, true};
}

Answer pinConnected(const HostCall &call)
{
    if (!call.effect || (call.value != 0 && call.value != 1))
        return {1};
    const VstInt32 pins = call.value == 0 ? call.effect->numInputs : call.effect->numOutputs;
    return call.index < pins ? Answer{0, true} : Answer{1};
}

Answer copyText(void *destination, const char *text, std::size_t size)
{
    if (!destination)
        return {0};
    std::memcpy(destination, text, size);
    return {1};
}

Answer canDo(const HostCall &call)
{
    if (!call.ptr)
        return {0};
    for (const char *capability : kCapabilities)
        if (std::strcmp(static_cast<const char *>(call.ptr), capability) == 0)
            return {1};
    return {0};
}

Answer processLevel(const HostCall &call)
{
    bool isRealtime = false;
    call.withOwner([&](const IVSTEffectOwner &owner) { isRealtime = owner.isRealtime(); });
    return {isRealtime ? vst::kVstProcessLevelRealtime : call.context.processLevel()};
}

Answer ioChanged(const HostCall &call)
{
    if (!call.effect)
        return {0};
    DebugLog(L"Host Callback - audioMasterIOChanged");
    call.withOwner([](IVSTEffectOwner &owner) { owner.ioChanged(); });
    return {0};
}

Answer idle(const HostCall &call)
{
    if (call.effect)
        VSTEffect::dispatchUnguarded(call.effect, vst::effEditIdle);
    return {0};
}

Answer sizeWindow(const HostCall &call)
{
    bool resized = false;
    call.withOwner([&](IVSTEffectOwner &owner) {
        resized = owner.resizeEditor(call.index, static_cast<VstInt32>(call.value));
    });
    return {resized ? 1 : 0};
}

/// Passes a notification on, unless it comes from the plug-in that is to be ignored; says whether it did.
template <typename Operation>
bool forward(const HostCall &call, Operation &&operation)
{
    bool forwarded = false;
    call.withOwner([&](IVSTEffectOwner &owner) {
        forwarded = !call.context.isIgnored(&owner);
        if (forwarded)
            operation(owner);
    });
    return forwarded;
}

Answer automate(const HostCall &call)
{
    forward(call, [&](IVSTEffectOwner &owner) { owner.parameterChanged(call.index, call.opt); });
    return {0};
}

Answer updateDisplay(const HostCall &call)
{
    forward(call, [](IVSTEffectOwner &owner) { owner.refreshDisplay(); });
    return {1};
}

Answer edit(const HostCall &call, bool begins)
{
    return {forward(call, [&](IVSTEffectOwner &owner) { owner.parameterEdit(call.index, begins); }) ? 1 : 0};
}

Answer wantMidi(const HostCall &call)
{
    call.withOwner([](IVSTEffectOwner &owner) { owner.setWantsMidi(); });
    return {1};
}

Answer needIdle(const HostCall &call)
{
    call.withOwner([](IVSTEffectOwner &owner) { owner.setNeedsIdle(); });
    return {1};
}

/// The opcodes that tell something of the host itself.
Answer answerFromSettings(const HostCall &call)
{
    switch (call.opcode) {
    case audioMasterVersion:
        return {kHostVstVersion};
    case audioMasterGetTime:
        return {reinterpret_cast<VstIntPtr>(call.context.timeInfo())};
    case vst::audioMasterGetNumAutomatableParameters:
        return {kAutomatableParameters};
    case audioMasterGetSampleRate:
        return {call.context.sampleRate()};
    case audioMasterGetBlockSize:
        return {call.context.blockSize()};
    case audioMasterGetVendorString:
        return copyText(call.ptr, kHostVendor, sizeof kHostVendor);
    case audioMasterGetProductString:
        return copyText(call.ptr, kHostProduct, sizeof kHostProduct);
    case audioMasterGetVendorVersion:
        return {1};
    case audioMasterCanDo:
        return canDo(call);
    case vst::audioMasterGetLanguage:
        return {vst::kVstLangEnglish};
    default:
        return {0};
    }
}

Answer answer(const HostCall &call)
{
    switch (call.opcode) {
    case audioMasterAutomate:
        return automate(call);
    case audioMasterCurrentId:
        return currentId(call);
    case vst::audioMasterIdle:
        return idle(call);
    case vst::audioMasterPinConnected:
        return pinConnected(call);
    case audioMasterWantMidi:
        return wantMidi(call);
    case vst::audioMasterIOChanged:
        return ioChanged(call);
    case vst::audioMasterNeedIdle:
        return needIdle(call);
    case audioMasterSizeWindow:
        return sizeWindow(call);
    case audioMasterGetCurrentProcessLevel:
        return processLevel(call);
    case vst::audioMasterUpdateDisplay:
        return updateDisplay(call);
    case audioMasterBeginEdit:
        return edit(call, true);
    case audioMasterEndEdit:
        return edit(call, false);
    default:
        return answerFromSettings(call);
    }
}

} // namespace

VstIntPtr VSTHostCallback(AEffect *effect, VstInt32 opcode, VstInt32 index, VstIntPtr value, void *ptr,
                          float opt)
{
    const bool isRefused = !VSTCallbackNesting::enter();
    const auto leaving = qScopeGuard(VSTCallbackNesting::leave);
    if (isRefused)
        return 0;
    DebugTrace(L"VST HostCallback(%d, %d, %d, %p, %f);", opcode, index, static_cast<VstInt32>(value), ptr,
               static_cast<double>(opt));
    const Answer result = answer({VSTHostContext::instance(), effect, opcode, index, value, ptr, opt});
    if (!result.direct)
        DebugTrace(L"VST HostCallback returned %d", static_cast<VstInt32>(result.value));
    return result.value;
}
