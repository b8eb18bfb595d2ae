#include "Main/AudioEngineController/Effects/VST/VSTHostCallback.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/VSTEffect.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"

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

thread_local std::int32_t t_activeCalls = 0;

/// One call of the callback while it is answered.
struct HostCall {
    VSTHost &host;
    AEffect *effect;
    VstInt32 opcode;
    VstInt32 index;
    VstIntPtr value;
    void *ptr;
    float opt;

    /// Lets the calling plug-in's object do something, if there is one; says whether there was.
    template <typename Operation>
    bool withPlugin(Operation &&operation) const
    {
        return host.withCallingPlugin(effect, operation);
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
    if (!call.host.shellIdOfPluginBeingLoaded(id))
        call.withPlugin([&](VSTPlugin &plugin) { id = plugin.shellId(); });
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
    call.withPlugin([&](const VSTPlugin &plugin) { isRealtime = plugin.isRealtime(); });
    return {isRealtime ? vst::kVstProcessLevelRealtime : call.host.processLevel()};
}

Answer ioChanged(const HostCall &call)
{
    if (!call.effect)
        return {0};
    DebugLog(L"Host Callback - audioMasterIOChanged");
    call.withPlugin([](VSTPlugin &plugin) { plugin.ioChanged(); });
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
    call.withPlugin([&](VSTPlugin &plugin) {
        resized = plugin.resizeEditor(call.index, static_cast<VstInt32>(call.value));
    });
    return {resized ? 1 : 0};
}

/// Passes a notification on, unless it comes from the plug-in that is to be ignored; says whether it did.
template <typename Operation>
bool forward(const HostCall &call, Operation &&operation)
{
    bool forwarded = false;
    call.withPlugin([&](VSTPlugin &plugin) {
        forwarded = !call.host.isIgnored(&plugin);
        if (forwarded)
            operation(plugin);
    });
    return forwarded;
}

Answer automate(const HostCall &call)
{
    forward(call, [&](VSTPlugin &plugin) { plugin.parameterChanged(call.index, call.opt); });
    return {0};
}

Answer updateDisplay(const HostCall &call)
{
    forward(call, [](VSTPlugin &plugin) { plugin.refreshDisplay(); });
    return {1};
}

Answer edit(const HostCall &call, bool begins)
{
    return {forward(call, [&](VSTPlugin &plugin) { plugin.parameterEdit(call.index, begins); }) ? 1 : 0};
}

Answer wantMidi(const HostCall &call)
{
    call.withPlugin([](VSTPlugin &plugin) { plugin.setWantsMidi(); });
    return {1};
}

Answer needIdle(const HostCall &call)
{
    call.withPlugin([](VSTPlugin &plugin) { plugin.setNeedsIdle(); });
    return {1};
}

/// The opcodes that tell something of the host itself.
Answer answerFromSettings(const HostCall &call)
{
    switch (call.opcode) {
    case audioMasterVersion:
        return {kHostVstVersion};
    case audioMasterGetTime:
        return {reinterpret_cast<VstIntPtr>(call.host.timeInfo())};
    case vst::audioMasterGetNumAutomatableParameters:
        return {kAutomatableParameters};
    case audioMasterGetSampleRate:
        return {call.host.sampleRate()};
    case audioMasterGetBlockSize:
        return {call.host.blockSize()};
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

/// Counts one active call on this thread; false when it must be refused. The farewell comes with the scope's
/// end also when an exception passes.
class ActiveCall {
public:
    ActiveCall()
    {
        ++t_activeCalls;
        if (static_cast<std::uint32_t>(t_activeCalls) <= std::uint32_t(VSTCallbackNesting::kMaxActive))
            return;
        if (t_activeCalls >= VSTCallbackNesting::kRunaway) {
            t_activeCalls = 0;
            return;
        }
        m_refused = true;
        DebugLog(L"VSTHost::HostCallback: Exceeded max Reentrancy: %d of %d", t_activeCalls,
                 VSTCallbackNesting::kMaxActive);
    }
    ~ActiveCall() { --t_activeCalls; }
    ActiveCall(const ActiveCall &) = delete;
    ActiveCall &operator=(const ActiveCall &) = delete;

    bool isRefused() const { return m_refused; }

private:
    bool m_refused = false;
};

} // namespace

std::int32_t VSTCallbackNesting::active() { return t_activeCalls; }

void VSTCallbackNesting::setActive(std::int32_t count) { t_activeCalls = count; }

VstIntPtr VSTHostCallback(AEffect *effect, VstInt32 opcode, VstInt32 index, VstIntPtr value, void *ptr,
                          float opt)
{
    const ActiveCall active;
    if (active.isRefused())
        return 0;
    DebugTrace(L"VST HostCallback(%d, %d, %d, %p, %f);", opcode, index, static_cast<VstInt32>(value), ptr,
               static_cast<double>(opt));
    const Answer result = answer({VSTHost::instance(), effect, opcode, index, value, ptr, opt});
    if (!result.direct)
        DebugTrace(L"VST HostCallback returned %d", static_cast<VstInt32>(result.value));
    return result.value;
}
