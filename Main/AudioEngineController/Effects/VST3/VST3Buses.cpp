#include "Main/AudioEngineController/Effects/VST3/VST3Buses.h"

#include <algorithm>
#include <limits>

using namespace Steinberg;

namespace {

/// More buses than any plug-in has; what a plug-in states beyond is not believed.
constexpr int32 kMaxBuses = 1024;

} // namespace

std::vector<VST3Bus> audioBuses(Vst::IComponent &component, Vst::BusDirection direction)
{
    std::vector<VST3Bus> buses;
    bool hasMain = false;
    const int32 count = std::min(component.getBusCount(Vst::kAudio, direction), kMaxBuses);
    for (int32 index = 0; index < count; ++index) {
        Vst::BusInfo info = {};
        const bool isKnown = component.getBusInfo(Vst::kAudio, direction, index, info) == kResultOk;
        const bool isMain = isKnown && info.busType == Vst::kMain;
        hasMain |= isMain;
        buses.push_back({isKnown ? std::max<int32>(info.channelCount, 0) : 0, isMain});
    }
    for (VST3Bus &bus : buses)
        bus.isUsed |= !hasMain;
    return buses;
}

int32 usedChannels(const std::vector<VST3Bus> &buses)
{
    int64 channels = 0;
    for (const VST3Bus &bus : buses)
        channels += bus.isUsed ? bus.channels : 0;
    return static_cast<int32>(std::min<int64>(channels, std::numeric_limits<int32>::max()));
}
