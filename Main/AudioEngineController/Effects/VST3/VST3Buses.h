#pragma once

#include <pluginterfaces/vst/ivstcomponent.h>

#include <vector>

/// One audio bus of a component.
struct VST3Bus {
    Steinberg::int32 channels; ///< 0 where the component does not describe the bus
    bool isUsed;               ///< a main bus, or any where none is main
};

/// The audio buses of a direction, in the component's order.
std::vector<VST3Bus> audioBuses(Steinberg::Vst::IComponent &component,
                                Steinberg::Vst::BusDirection direction);
/// The channels of the used ones together.
Steinberg::int32 usedChannels(const std::vector<VST3Bus> &buses);
