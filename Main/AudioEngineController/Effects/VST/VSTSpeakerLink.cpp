#include "Main/AudioEngineController/Effects/VST/VSTSpeakerLink.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostContext.h"

#include <algorithm>
#include <cstdio>

namespace {

/// NOTE: a loudness meter of this name shows what it is told, not what it is given; it is told its own
/// channels, of which it shows at most eight.
constexpr char kOwnLayoutMark[] = "VisLM";
constexpr VstInt32 kOwnLayoutChannels = 8;

} // namespace

bool VSTSpeakerLink::isDue() const { return m_pending || (m_toldCounts && *m_toldCounts != statedCounts()); }

bool VSTSpeakerLink::tell(Counts requested, KriticalSection &processingLock)
{
    m_pending = false;
    const Counts stated = statedCounts();
    m_toldCounts = stated;
    const std::optional<Counts> counts = countsToTell(requested, stated);
    if (counts) {
        const TAutoLockCS lock(&processingLock);
        m_accepted = tellSpeakers(*counts);
    } else {
        m_accepted = false;
    }
    m_pending = false; // some report changed channels only because they were told
    return m_accepted;
}

VSTSpeakerLink::Counts VSTSpeakerLink::statedCounts() const
{
    const VSTEffect::Fields fields = m_effect.fields().value_or(VSTEffect::Fields{});
    return {fields.numInputs, fields.numOutputs};
}

std::optional<VSTSpeakerLink::Counts> VSTSpeakerLink::countsToTell(Counts requested, Counts stated) const
{
    Counts used = requested;
    if (m_naming.name.contains(QLatin1String(kOwnLayoutMark)))
        used = {std::min(stated.inputs, kOwnLayoutChannels), std::min(stated.outputs, kOwnLayoutChannels)};
    // The parenthesis stays open: who reads these lines knows them so.
    std::printf("USA: %d,%d | %d,%d | (%d,%d\n", requested.inputs, requested.outputs, used.inputs,
                used.outputs, stated.inputs, stated.outputs);
    const VSTHostContext &context = VSTHostContext::instance();
    const Counts formats = {context.busFormatChannels(used.inputs), context.busFormatChannels(used.outputs)};
    if (stated.outputs > stated.inputs && formats.outputs == stated.outputs)
        used.inputs = stated.inputs;
    else if (stated.outputs < stated.inputs && formats.inputs == stated.inputs)
        used.outputs = stated.outputs;
    return formats.inputs == 0 ? std::nullopt : std::make_optional(used);
}

bool VSTSpeakerLink::tellSpeakers(Counts counts)
{
    const VSTHostContext &context = VSTHostContext::instance();
    const VSTSpeakerArrangement *inputs = context.findArrangement(counts.inputs);
    const VSTSpeakerArrangement *outputs = context.findArrangement(counts.outputs);
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
std::optional<bool> VSTSpeakerLink::offer(VSTArrangementPair speakers)
{
    const auto answer = m_effect.dispatchAt(effSetSpeakerArrangement, 0,
                                            reinterpret_cast<VstIntPtr>(&speakers.first), &speakers.second);
    if (!answer) {
        DebugLog(L"Exception Caught in VST Plugin");
        return std::nullopt;
    }
    return *answer != 0;
}
