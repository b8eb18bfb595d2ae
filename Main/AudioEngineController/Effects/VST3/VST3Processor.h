#pragma once

#include "Main/AudioEngineController/Effects/Plugin/ChannelBuffers.h"
#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3NoParameterChanges.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Buses.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Speakers.h"

#include <pluginterfaces/base/smartpointer.h>
#include <pluginterfaces/vst/ivstaudioprocessor.h>

#include <array>
#include <vector>

/// The audio side of an instance. Audio goes through the used buses, one after the other; the others are
/// switched off and get silence. Exceptions of the plug-in leave the operations.
class VST3Processor {
public:
    /// Takes the audio side of a component that is initialised; false when it has none that takes 32-bit
    /// samples. The same component again keeps its bus formats; before another one, detach.
    bool attach(Steinberg::Vst::IComponent *component);
    /// Lets go of the component, which must still be there.
    void detach();

    bool setUp(double sampleRate, Steinberg::int32 blockSize);
    /// Offers the plug-in, which is stopped, a bus format for the first used bus of each direction, by
    /// direction; where it refuses them, those that may be discrete channels as such. True when it took them.
    /// From then on the audio of such a bus is in the order of its format. The buses must have been read, and
    /// are to be read again.
    bool setFormats(const std::array<int, 2> &formatCodes, const VST3PluginSettings &settings);
    /// Activates the component and switches processing on. After a false or an exception, deactivate.
    bool start();
    /// Switches processing off; the component stays active.
    void stop();
    void deactivate();
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
        /// The first used bus: for each of its channels the position in its bus format; empty: as they come.
        std::vector<std::size_t> positions;

        std::size_t firstUsed() const;
        void lay(float **used, std::size_t count, Steinberg::int32 frames);
    };

    void activateBuses(bool active);
    std::vector<Steinberg::Vst::SpeakerArrangement> arrangements(Steinberg::Vst::BusDirection direction,
                                                                 Steinberg::Vst::SpeakerArrangement first);
    bool offer(const std::array<int, 2> &formatCodes, const VST3PluginSettings &settings);

    Steinberg::Vst::IComponent *m_component = nullptr; ///< not owned
    Steinberg::IPtr<Steinberg::Vst::IAudioProcessor> m_processor;
    std::array<Side, 2> m_sides; ///< by direction
    VST3Owned<VST3NoParameterChanges> m_noChanges = VST3NoParameterChanges::createOwned();
};
