#pragma once

#include "Main/AudioEngineController/Effects/ChannelBuffers.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Buses.h"
#include "Main/AudioEngineController/Effects/VST3/VST3NoParameterChanges.h"

#include <pluginterfaces/base/smartpointer.h>
#include <pluginterfaces/vst/ivstaudioprocessor.h>

#include <array>
#include <vector>

/// The audio side of an instance. Audio goes through the used buses, one after the other; the others are
/// switched off and get silence. Exceptions of the plug-in leave the operations.
class VST3Processor {
public:
    /// Takes the audio side of a component that is initialised; false when it has none that takes 32-bit
    /// samples.
    bool attach(Steinberg::Vst::IComponent *component);
    /// Lets go of the component, which must still be there.
    void detach();

    bool setUp(double sampleRate, Steinberg::int32 blockSize);
    bool start();
    void stop();
    /// Reads the buses; the channels of the used ones in both directions. None while nothing is attached.
    ChannelSetup readChannels();
    bool process(ChannelBuffers &buffers, Steinberg::int32 frames);

private:
    /// The buses of one direction as a block is handed over.
    struct Side {
        std::vector<VST3Bus> buses;
        std::vector<Steinberg::Vst::AudioBusBuffers> buffers;
        std::vector<float *> channels; ///< of all buses
        std::vector<float> spare;      ///< what channels of unused buses share

        void lay(float **used, std::size_t count, Steinberg::int32 frames);
    };

    void activateBuses(bool active);

    Steinberg::Vst::IComponent *m_component = nullptr; ///< not owned
    Steinberg::IPtr<Steinberg::Vst::IAudioProcessor> m_processor;
    std::array<Side, 2> m_sides; ///< by direction
    VST3Owned<VST3NoParameterChanges> m_noChanges = VST3NoParameterChanges::createOwned();
};
