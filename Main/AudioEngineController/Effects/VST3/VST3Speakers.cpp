#include "Main/AudioEngineController/Effects/VST3/VST3Speakers.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/BusFormats/BusFormat.h"

#include <array>
#include <cstddef>

using namespace Steinberg;
using Vst::Speaker;
using Vst::SpeakerArrangement;

namespace {

namespace Arr = Vst::SpeakerArr;

/// By number of channels. Some have another number of speakers: plug-ins have been offered these for long.
constexpr std::array<int32, 25> kDiscrete = {
    0x0,       0x80000,   0x3,       0x7,       0x107,      0x37,       0x3F,      0xF7,      0xFF,
    0x2D037,   0x300063F, 0x2F83F,   0x2D63F,   0x302D637,  0x302D63F,  0x302D6F7, 0x302D6FF, 0x302D6FF,
    0x302D6FF, 0x302D6FF, 0x302D6FF, 0x302D6FF, 0x7307FFFF, 0x7307FFFF, 0x7307FFFF};

/// The highest number of channels whose limited arrangement does not depend on the format.
constexpr int kMaxPlainLimit = 6;

/// One named format as plug-ins are offered it.
struct NamedFormat {
    VST3ChannelMap channelMap;
    SpeakerArrangement arrangement = 0;
};

NamedFormat namedFormat(const BusFormat &format)
{
    NamedFormat named;
    for (const std::string &label : format.labels)
        named.arrangement |= vst3Speaker(label);
    // A plug-in's channels are in the order of the bits.
    for (int position = 0; position < format.channels(); ++position) {
        const Speaker speaker = vst3Speaker(format.labels[static_cast<std::size_t>(position)]);
        named.channelMap[position] = Arr::getSpeakerIndex(speaker, named.arrangement);
    }
    return named;
}

const std::map<int, NamedFormat> &namedFormats()
{
    static const std::map<int, NamedFormat> formats = [] {
        std::map<int, NamedFormat> built;
        for (const BusFormat &format : busFormats())
            built.emplace(format.code, namedFormat(format));
        return built;
    }();
    return formats;
}

/// What ten channels are offered: those with a pair above the listener, and those with a layer of heights
/// over 5.1.
SpeakerArrangement tenChannels(int formatCode)
{
    switch (formatCode) {
    case 50:
    case 60:
    case 61:
    case 62:
    case 63:
    case 64:
        return Arr::k71_2;
    case 70:
    case 71:
    case 72:
        return Arr::k51_4;
    default:
        return 0;
    }
}

SpeakerArrangement discreteArrangement(int channels, VST3ChannelMap &channelMap)
{
    if (channels < 0 || static_cast<std::size_t>(channels) >= kDiscrete.size())
        return Arr::kStereo;
    for (int position = 0; position < channels; ++position)
        channelMap[position] = position;
    return static_cast<SpeakerArrangement>(kDiscrete[static_cast<std::size_t>(channels)]);
}

} // namespace

SpeakerArrangement arrangementFor(int formatCode, VST3ChannelMap &channelMap,
                                  const VST3PluginSettings &pluginSettings)
{
    if (formatCode & kDiscreteChannels)
        return discreteArrangement(formatCode & ~kDiscreteChannels, channelMap);
    const auto named = namedFormats().find(formatCode);
    if (named == namedFormats().end())
        return Arr::kStereo;
    channelMap = named->second.channelMap;
    const SpeakerArrangement full = named->second.arrangement;
    const qint32 limit = pluginSettings.maxChannels;
    if (limit == 0 || Arr::getChannelCount(full) <= limit)
        return full;
    const SpeakerArrangement limited = limitedArrangement(formatCode, limit);
    if (limited == 0)
        return full;
    DebugLog(L"LIMIT SPEAKER ARRANGEMENT FOR %d to %d", formatCode, static_cast<int32>(limited));
    return limited;
}

SpeakerArrangement limitedArrangement(int formatCode, int maxChannels)
{
    if (maxChannels >= 1 && maxChannels <= kMaxPlainLimit)
        return static_cast<SpeakerArrangement>(kDiscrete[static_cast<std::size_t>(maxChannels)]);
    if (maxChannels == 12)
        return Arr::k71_4;
    return maxChannels == 10 ? tenChannels(formatCode) : Arr::k71Music;
}

Speaker vst3Speaker(const std::string &label)
{
    static const std::map<std::string, Speaker> speakers = {
        {"M", Vst::kSpeakerM},         {"L", Vst::kSpeakerL},         {"R", Vst::kSpeakerR},
        {"C", Vst::kSpeakerC},         {"LFE", Vst::kSpeakerLfe},     {"LFE1", Vst::kSpeakerLfe},
        {"LFE2", Vst::kSpeakerLfe2},   {"Ls", Vst::kSpeakerLs},       {"Rs", Vst::kSpeakerRs},
        {"Lsr", Vst::kSpeakerLs},      {"Rsr", Vst::kSpeakerRs},      {"Lss", Vst::kSpeakerSl},
        {"Rss", Vst::kSpeakerSr},      {"Cs", Vst::kSpeakerCs},       {"Lc", Vst::kSpeakerLc},
        {"Rc", Vst::kSpeakerRc},       {"Lw", Vst::kSpeakerLc},       {"Rw", Vst::kSpeakerRc},
        {"T", Vst::kSpeakerTc},        {"Ltf", Vst::kSpeakerTfl},     {"Ctf", Vst::kSpeakerTfc},
        {"Rtf", Vst::kSpeakerTfr},     {"Ltm", Vst::kSpeakerTsl},     {"Rtm", Vst::kSpeakerTsr},
        {"Ltr", Vst::kSpeakerTrl},     {"Ctr", Vst::kSpeakerTrc},     {"Rtr", Vst::kSpeakerTrr},
        {"Lbf", Vst::kSpeakerBfl},     {"Cbf", Vst::kSpeakerBfc},     {"Rbf", Vst::kSpeakerBfr},
        {"ACN0", Vst::kSpeakerACN0},   {"ACN1", Vst::kSpeakerACN1},   {"ACN2", Vst::kSpeakerACN2},
        {"ACN3", Vst::kSpeakerACN3},   {"ACN4", Vst::kSpeakerACN4},   {"ACN5", Vst::kSpeakerACN5},
        {"ACN6", Vst::kSpeakerACN6},   {"ACN7", Vst::kSpeakerACN7},   {"ACN8", Vst::kSpeakerACN8},
        {"ACN9", Vst::kSpeakerACN9},   {"ACN10", Vst::kSpeakerACN10}, {"ACN11", Vst::kSpeakerACN11},
        {"ACN12", Vst::kSpeakerACN12}, {"ACN13", Vst::kSpeakerACN13}, {"ACN14", Vst::kSpeakerACN14},
        {"ACN15", Vst::kSpeakerACN15}};
    const auto speaker = speakers.find(label);
    return speaker == speakers.end() ? 0 : speaker->second;
}
