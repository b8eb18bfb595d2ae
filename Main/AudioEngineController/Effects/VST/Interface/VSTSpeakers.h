#pragma once

#include "Main/AudioEngineController/Effects/BusFormats/BusFormat.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTInterface.h"

#include <map>
#include <string>
#include <utility>
#include <vector>

/// What `effSetSpeakerArrangement` hands over, with room for the widest layout.
struct VSTSpeakerArrangement {
    static constexpr int kMaxSpeakers = 36;

    VstInt32 type;
    VstInt32 numChannels;
    VstPublished::VstSpeakerProperties speakers[kMaxSpeakers];

    bool operator==(const VSTSpeakerArrangement &other) const;
};

/// The speaker type of a channel label, in the exact spelling; -2 for a label that stands for no speaker of
/// the interface, and plug-ins are handed that.
VstInt32 vstSpeakerType(const std::string &label);

/// A bus format as plug-ins are told it. Only some layouts have a type number of their own; the others are
/// user-defined (-2).
VSTSpeakerArrangement vstArrangement(const BusFormat &format);

/// The arrangements that are ready to be told, by their number of channels: of the formats of a number the
/// usual one.
using VSTArrangementTable = std::map<int, VSTSpeakerArrangement>;
VSTArrangementTable vstArrangementTable();

/// Inputs and outputs.
using VSTArrangementPair = std::pair<VSTSpeakerArrangement, VSTSpeakerArrangement>;
/// What can be told to a plug-in that refused the ready arrangements, or whose number of channels no bus
/// format has; the best first, none for a number of channels that no arrangement holds. For fewer than 15
/// channels all bus formats of the number, and for any number the channels without a layout.
std::vector<VSTArrangementPair> vstFallbackArrangements(int inputs, int outputs);
