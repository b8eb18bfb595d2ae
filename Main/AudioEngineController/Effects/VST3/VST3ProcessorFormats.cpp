#include "Main/AudioEngineController/Effects/BusFormats/BusFormat.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Processor.h"

#include <algorithm>

// The set-up of an instance's buses for bus formats of the studio.

using namespace Steinberg;

namespace {

constexpr Vst::BusDirection kDirections[] = {Vst::kInput, Vst::kOutput};

/// The code of the same channels without a layout, where the format may be given up; else the code itself.
int discreteCode(int formatCode)
{
    const BusFormat *format = findBusFormat(formatCode);
    return format && format->mayBeDiscrete ? kDiscreteChannels + format->channels() : formatCode;
}

/// For each channel of the plug-in the position in the bus format; none where the map is not that of as many
/// channels, as with an arrangement that was limited.
std::vector<std::size_t> positionsOf(const VST3ChannelMap &map, int channels)
{
    if (map.size() != static_cast<std::size_t>(channels))
        return {};
    std::vector<std::size_t> positions(map.size());
    for (const auto &[position, channel] : map)
        positions[static_cast<std::size_t>(channel)] = static_cast<std::size_t>(position);
    return positions;
}

} // namespace

std::size_t VST3Processor::Side::firstUsed() const
{
    const auto used = std::find_if(buses.begin(), buses.end(), [](const VST3Bus &bus) { return bus.isUsed; });
    return static_cast<std::size_t>(used - buses.begin());
}

bool VST3Processor::setFormats(const std::array<int, 2> &formatCodes, const VST3PluginSettings &settings)
{
    if (offer(formatCodes, settings))
        return true;
    const std::array<int, 2> discrete = {discreteCode(formatCodes[0]), discreteCode(formatCodes[1])};
    return discrete != formatCodes && offer(discrete, settings);
}

/// The arrangements of all buses of a direction: a new one for the first used, the others as they are.
std::vector<Vst::SpeakerArrangement> VST3Processor::arrangements(Vst::BusDirection direction,
                                                                 Vst::SpeakerArrangement first)
{
    const Side &side = m_sides[static_cast<std::size_t>(direction)];
    std::vector<Vst::SpeakerArrangement> all(side.buses.size());
    for (std::size_t index = 0; index < all.size(); ++index)
        m_processor->getBusArrangement(direction, static_cast<int32>(index), all[index]);
    if (side.firstUsed() < all.size())
        all[side.firstUsed()] = first;
    return all;
}

bool VST3Processor::offer(const std::array<int, 2> &formatCodes, const VST3PluginSettings &settings)
{
    std::array<Vst::SpeakerArrangement, 2> wanted = {};
    std::array<VST3ChannelMap, 2> maps;
    for (std::size_t side = 0; side < 2; ++side) {
        wanted[side] = arrangementFor(formatCodes[side], maps[side], settings);
        m_sides[side].positions.clear();
    }
    auto inputs = arrangements(Vst::kInput, wanted[Vst::kInput]);
    auto outputs = arrangements(Vst::kOutput, wanted[Vst::kOutput]);
    if (m_processor->setBusArrangements(inputs.data(), static_cast<int32>(inputs.size()), outputs.data(),
                                        static_cast<int32>(outputs.size())) != kResultTrue)
        return false;
    for (const Vst::BusDirection direction : kDirections) {
        const auto side = static_cast<std::size_t>(direction);
        Vst::SpeakerArrangement taken = 0; // some agree and take another
        const auto bus = static_cast<int32>(m_sides[side].firstUsed());
        m_processor->getBusArrangement(direction, bus, taken);
        if (taken == wanted[side])
            m_sides[side].positions = positionsOf(maps[side], Vst::SpeakerArr::getChannelCount(wanted[side]));
    }
    return true;
}
