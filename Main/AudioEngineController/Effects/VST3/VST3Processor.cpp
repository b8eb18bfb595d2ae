#include "Main/AudioEngineController/Effects/VST3/VST3Processor.h"

#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"

#include <algorithm>

using namespace Steinberg;

namespace {

constexpr Vst::BusDirection kDirections[] = {Vst::kInput, Vst::kOutput};

} // namespace

bool VST3Processor::attach(Vst::IComponent *component)
{
    m_component = component;
    m_processor = FUnknownPtr<Vst::IAudioProcessor>(component);
    return m_processor && m_processor->canProcessSampleSize(Vst::kSample32) == kResultOk;
}

void VST3Processor::detach()
{
    m_component = nullptr;
    for (Side &side : m_sides)
        side.positions.clear(); // those of the next component are its own
    if (Vst::IAudioProcessor *processor = m_processor.take())
        processor->release();
}

bool VST3Processor::setUp(double sampleRate, int32 blockSize)
{
    Vst::ProcessSetup setup = {};
    setup.processMode = Vst::kRealtime;
    setup.symbolicSampleSize = Vst::kSample32;
    setup.maxSamplesPerBlock = blockSize;
    setup.sampleRate = sampleRate;
    return m_processor && m_processor->setupProcessing(setup) == kResultOk;
}

bool VST3Processor::start()
{
    activateBuses(true);
    if (m_component->setActive(true) != kResultOk)
        return false;
    m_processor->setProcessing(true); // many do not implement it
    return true;
}

void VST3Processor::stop() { m_processor->setProcessing(false); }

void VST3Processor::deactivate()
{
    m_component->setActive(false);
    activateBuses(false);
}

void VST3Processor::activateBuses(bool active)
{
    for (const Vst::BusDirection direction : kDirections) {
        const std::vector<VST3Bus> &buses = m_sides[static_cast<std::size_t>(direction)].buses;
        for (std::size_t index = 0; index < buses.size(); ++index)
            if (buses[index].isUsed)
                m_component->activateBus(Vst::kAudio, direction, static_cast<int32>(index), active);
    }
}

ChannelSetup VST3Processor::readChannels()
{
    if (!m_component)
        return {};
    for (const Vst::BusDirection direction : kDirections)
        m_sides[static_cast<std::size_t>(direction)].buses = audioBuses(*m_component, direction);
    return {{0, usedChannels(m_sides[Vst::kInput].buses) - 1},
            {0, usedChannels(m_sides[Vst::kOutput].buses) - 1}};
}

/// Points each bus at its channels: the used ones in order, in the first of them that of its bus format, the
/// others all at the spare one.
void VST3Processor::Side::lay(float **used, std::size_t count, int32 frames)
{
    spare.assign(static_cast<std::size_t>(frames), 0.0f);
    channels.clear();
    buffers.clear();
    std::size_t next = 0;
    for (const VST3Bus &bus : buses) {
        const auto width = static_cast<std::size_t>(std::min(bus.channels, int32(AudioPlugin::kMaxChannels)));
        const bool isOrdered = next == 0 && positions.size() == width;
        for (std::size_t channel = 0; channel < width; ++channel) {
            const std::size_t at = next + (isOrdered ? positions[channel] : channel);
            channels.push_back(bus.isUsed && at < count ? used[at] : spare.data());
        }
        next += bus.isUsed ? width : 0;
        Vst::AudioBusBuffers &laid = buffers.emplace_back();
        laid.numChannels = static_cast<int32>(width);
    }
    float **first = channels.data();
    for (Vst::AudioBusBuffers &bus : buffers) {
        bus.channelBuffers32 = first;
        first += bus.numChannels;
    }
}

bool VST3Processor::process(ChannelBuffers &buffers, int32 frames)
{
    Side &inputs = m_sides[Vst::kInput];
    Side &outputs = m_sides[Vst::kOutput];
    inputs.lay(buffers.inputs(), buffers.inputCount(), frames);
    outputs.lay(buffers.outputs(), buffers.outputCount(), frames);
    Vst::ProcessData data = {};
    data.processMode = Vst::kRealtime;
    data.symbolicSampleSize = Vst::kSample32;
    data.numSamples = frames;
    data.numInputs = static_cast<int32>(inputs.buffers.size());
    data.numOutputs = static_cast<int32>(outputs.buffers.size());
    data.inputs = inputs.buffers.data();
    data.outputs = outputs.buffers.data();
    data.inputParameterChanges = m_noChanges.get();
    data.outputParameterChanges = m_noChanges.get();
    return m_processor->process(data) == kResultOk;
}
