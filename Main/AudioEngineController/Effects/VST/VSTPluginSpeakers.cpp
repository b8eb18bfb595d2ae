#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"

#include <algorithm>
#include <cstdio>

// What a plug-in is told about the speakers behind its channels.

namespace {

/// NOTE: a loudness meter of this name shows what it is told, not what it is given; it is told its own
/// channels, of which it shows at most eight.
constexpr char kOwnLayoutMark[] = "VisLM";
constexpr VstInt32 kOwnLayoutChannels = 8;

} // namespace

bool VSTPlugin::UpdateSpeakerArrangement(int inputs, int outputs, bool force)
{
    if (!isOpen() || !isCallable())
        return false;
    const Counts stated = statedCounts();
    const bool areNew = m_toldCounts && *m_toldCounts != stated;
    if (!areNew && !m_speakersPending && !force)
        return m_speakersAccepted;
    m_speakersPending = false;
    m_toldCounts = stated;
    const std::optional<Counts> counts = countsToTell({inputs, outputs}, stated);
    m_speakersAccepted = counts && tellSpeakers(*counts);
    m_speakersPending = false; // some report changed channels only because they were told
    const ChannelSetup known = channels();
    const ChannelSetup now = readChannels();
    if (now.inputs.span() != known.inputs.span() || now.outputs.span() != known.outputs.span())
        rebuildChannels(); // it adapted to the speakers, and not every plug-in says so
    return m_speakersAccepted;
}

VSTPlugin::Counts VSTPlugin::statedCounts() const
{
    const VSTEffect::Fields fields = m_effect.fields().value_or(VSTEffect::Fields{});
    return {fields.numInputs, fields.numOutputs};
}

std::optional<VSTPlugin::Counts> VSTPlugin::countsToTell(Counts requested, Counts stated) const
{
    Counts used = requested;
    if (m_name.contains(QLatin1String(kOwnLayoutMark)))
        used = {std::min(stated.inputs, kOwnLayoutChannels), std::min(stated.outputs, kOwnLayoutChannels)};
    // The parenthesis stays open: who reads these lines knows them so.
    std::printf("USA: %d,%d | %d,%d | (%d,%d\n", requested.inputs, requested.outputs, used.inputs,
                used.outputs, stated.inputs, stated.outputs);
    const Counts formats = {m_host.busFormatChannels(used.inputs), m_host.busFormatChannels(used.outputs)};
    if (stated.outputs > stated.inputs && formats.outputs == stated.outputs)
        used.inputs = stated.inputs;
    else if (stated.outputs < stated.inputs && formats.inputs == stated.inputs)
        used.outputs = stated.outputs;
    return formats.inputs == 0 ? std::nullopt : std::make_optional(used);
}

bool VSTPlugin::tellSpeakers(Counts counts)
{
    const TAutoLockCS lock(&processingLock());
    const VSTSpeakerArrangement *inputs = m_host.findArrangement(counts.inputs);
    const VSTSpeakerArrangement *outputs = m_host.findArrangement(counts.outputs);
    std::vector<VSTArrangementPair> offers = vstFallbackArrangements(counts.inputs, counts.outputs);
    if (inputs && outputs) {
        DebugTrace(L"VSTPlugin::UpdateSpeakerArrangement: Setting to: %d->%d", counts.inputs, counts.outputs);
        const VSTArrangementPair ready(*inputs, *outputs);
        offers.erase(std::remove(offers.begin(), offers.end(), ready), offers.end());
        offers.insert(offers.begin(), ready);
    }
    for (const VSTArrangementPair &speakers : offers)
        if (const std::optional<bool> accepted = offer(speakers); !accepted || *accepted)
            return accepted.value_or(false);
    return false;
}

/// Whether the plug-in accepts the arrangements, of which it gets copies; nothing when the call failed.
std::optional<bool> VSTPlugin::offer(VSTArrangementPair speakers)
{
    const auto answer = m_effect.dispatchAt(effSetSpeakerArrangement, 0,
                                            reinterpret_cast<VstIntPtr>(&speakers.first), &speakers.second);
    if (!answer) {
        DebugLog(L"Exception Caught in VST Plugin");
        return std::nullopt;
    }
    return *answer != 0;
}
