#include "Main/AudioEngineController/Effects/VST/Interface/VSTSpeakers.h"

#include <algorithm>
#include <cstddef>
#include <cstring>

namespace {

constexpr VstInt32 kEmpty = -1;
constexpr VstInt32 kUserDefined = -2;
constexpr VstInt32 kUnknownSpeaker = -2;
/// From this number of channels on layouts have neither type numbers nor speakers for all their channels.
constexpr int kLargeLayout = 15;

/// The rear pair shares the types of the surround pair, and the pair above the listener those of the pair
/// above the front: the interface has no others for them.
const std::map<std::string, VstInt32> &speakerTypes()
{
    static const std::map<std::string, VstInt32> types = {
        {"L", 1},     {"M+30", 1},  {"R", 2},      {"M-30", 2},  {"C", 3},      {"M+0", 3},   {"Ls", 5},
        {"M+110", 5}, {"Rs", 6},    {"M-110", 6},  {"Lss", 10},  {"M+90", 10},  {"Rss", 11},  {"M-90", 11},
        {"Lsr", 5},   {"M+135", 5}, {"Rsr", 6},    {"M-135", 6}, {"LFE", 4},    {"LFE1", 4},  {"LFE2", 19},
        {"Ltf", 13},  {"U+45", 13}, {"Rtf", 15},   {"U-45", 15}, {"Ltm", 13},   {"U+90", 13}, {"Rtm", 15},
        {"U-90", 15}, {"Ltr", 16},  {"U+135", 16}, {"Rtr", 18},  {"U-135", 18}, {"T", 12},    {"U+0", 12}};
    return types;
}

/// The published type numbers of layouts, by the code of the bus format.
VstInt32 arrangementType(int code)
{
    static const std::map<int, VstInt32> types = {{1, 0},  {2, 1},  {3, 6},  {4, 11}, {5, 14},
                                                  {6, 15}, {7, 18}, {8, 20}, {9, 21}, {10, 22}};
    const auto type = types.find(code);
    return type == types.end() ? kUserDefined : type->second;
}

void addSpeaker(VSTSpeakerArrangement &arrangement, const std::string &name, VstInt32 type)
{
    VstPublished::VstSpeakerProperties &speaker = arrangement.speakers[arrangement.numChannels++];
    name.copy(speaker.name, sizeof speaker.name - 1);
    speaker.type = type;
}

/// That many channels, by number.
VSTSpeakerArrangement numberedArrangement(int channels)
{
    VSTSpeakerArrangement arrangement = {};
    arrangement.type = channels == 0 ? kEmpty : kUserDefined;
    for (int channel = 1; channel <= channels; ++channel)
        addSpeaker(arrangement, std::to_string(channel), kUnknownSpeaker);
    return arrangement;
}

std::vector<VSTSpeakerArrangement> candidates(int channels)
{
    std::vector<VSTSpeakerArrangement> found;
    if (channels < 0 || channels > VSTSpeakerArrangement::kMaxSpeakers)
        return found;
    if (channels < kLargeLayout)
        for (const BusFormat *format : busFormatsOfChannels(channels))
            found.push_back(vstArrangement(*format));
    found.push_back(numberedArrangement(channels));
    return found;
}

} // namespace

bool VSTSpeakerArrangement::operator==(const VSTSpeakerArrangement &other) const
{
    const auto isSame = [](const auto &one, const auto &two) {
        return one.type == two.type && std::strcmp(one.name, two.name) == 0;
    };
    return type == other.type && numChannels == other.numChannels &&
           std::equal(speakers, speakers + numChannels, other.speakers, isSame);
}

VstInt32 vstSpeakerType(const std::string &label)
{
    const auto type = speakerTypes().find(label);
    return type == speakerTypes().end() ? kUnknownSpeaker : type->second;
}

VSTSpeakerArrangement vstArrangement(const BusFormat &format)
{
    VSTSpeakerArrangement arrangement = {};
    arrangement.type = arrangementType(format.code);
    for (const std::string &label : format.labels)
        addSpeaker(arrangement, label, vstSpeakerType(label));
    return arrangement;
}

VSTArrangementTable vstArrangementTable()
{
    VSTArrangementTable table;
    for (const BusFormat &format : busFormats())
        table.emplace(format.channels(), vstArrangement(format));
    return table;
}

std::vector<VSTArrangementPair> vstFallbackArrangements(int inputs, int outputs)
{
    const std::vector<VSTSpeakerArrangement> ins = candidates(inputs);
    const std::vector<VSTSpeakerArrangement> outs = candidates(outputs);
    std::vector<VSTArrangementPair> pairs;
    for (std::size_t in = 0; in < ins.size(); ++in)
        for (std::size_t out = 0; out < outs.size(); ++out)
            if (inputs != outputs || in == out) // a plug-in that keeps the layout has the same on both sides
                pairs.emplace_back(ins[in], outs[out]);
    return pairs;
}
