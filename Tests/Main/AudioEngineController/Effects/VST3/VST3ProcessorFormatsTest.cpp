#include "Main/AudioEngineController/Effects/VST3/VST3Processor.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <iterator>
#include <map>
#include <sstream>

using namespace Steinberg;
using namespace Steinberg::Vst;

namespace {

/// A component with a side chain before and behind its main input. A block takes each output channel from the
/// main input's channel of the same index. It takes stereo and one other arrangement for its main buses.
class Reverberator final : public IComponent, public IAudioProcessor {
public:
    tresult PLUGIN_API queryInterface(const TUID iid, void **object) override
    {
        QUERY_INTERFACE(iid, object, IAudioProcessor::iid, IAudioProcessor)
        *object = nullptr;
        return kNoInterface;
    }
    uint32 PLUGIN_API addRef() override { return 1; }
    uint32 PLUGIN_API release() override { return 1; }
    tresult PLUGIN_API initialize(FUnknown *) override { return kResultOk; }
    tresult PLUGIN_API terminate() override { return kResultOk; }
    tresult PLUGIN_API getControllerClassId(TUID) override { return kNotImplemented; }
    tresult PLUGIN_API setIoMode(IoMode) override { return kNotImplemented; }
    int32 PLUGIN_API getBusCount(MediaType, BusDirection direction) override
    {
        return static_cast<int32>(m_buses[direction].size());
    }
    tresult PLUGIN_API getBusInfo(MediaType, BusDirection direction, int32 index, BusInfo &info) override
    {
        info.channelCount = SpeakerArr::getChannelCount(m_buses[direction].at(std::size_t(index)));
        info.busType = index == (direction == kInput ? 1 : 0) ? kMain : kAux;
        return kResultOk;
    }
    tresult PLUGIN_API getRoutingInfo(RoutingInfo &, RoutingInfo &) override { return kNotImplemented; }
    tresult PLUGIN_API activateBus(MediaType, BusDirection, int32, TBool) override { return kResultOk; }
    tresult PLUGIN_API setActive(TBool) override { return kResultOk; }
    tresult PLUGIN_API setState(IBStream *) override { return kNotImplemented; }
    tresult PLUGIN_API getState(IBStream *) override { return kNotImplemented; }

    tresult PLUGIN_API setBusArrangements(SpeakerArrangement *inputs, int32 numIns,
                                          SpeakerArrangement *outputs, int32 numOuts) override
    {
        std::copy_n(inputs, numIns, std::ostream_iterator<SpeakerArrangement>(offered << std::hex, " "));
        std::copy_n(outputs, numOuts, std::ostream_iterator<SpeakerArrangement>(offered << "> ", " "));
        const auto isKnown = [this](SpeakerArrangement one) { return one == known || one == 0x3; };
        if (!isKnown(inputs[1]) || !isKnown(outputs[0]))
            return kResultFalse;
        m_buses = {{kInput, {inputs, inputs + numIns}}, {kOutput, {outputs, outputs + numOuts}}};
        if (takesOther)
            m_buses[kOutput][0] = takesOther;
        return kResultTrue;
    }
    tresult PLUGIN_API getBusArrangement(BusDirection direction, int32 index, SpeakerArrangement &is) override
    {
        is = m_buses[direction].at(std::size_t(index));
        return kResultOk;
    }
    tresult PLUGIN_API canProcessSampleSize(int32) override { return kResultOk; }
    uint32 PLUGIN_API getLatencySamples() override { return 0; }
    tresult PLUGIN_API setupProcessing(ProcessSetup &) override { return kResultOk; }
    tresult PLUGIN_API setProcessing(TBool) override { return kResultOk; }
    tresult PLUGIN_API process(ProcessData &data) override
    {
        const AudioBusBuffers &from = data.inputs[1];
        for (int32 channel = 0; channel < std::min(from.numChannels, data.outputs[0].numChannels); ++channel)
            data.outputs[0].channelBuffers32[channel][0] = from.channelBuffers32[channel][0] + float(channel);
        return kResultOk;
    }
    uint32 PLUGIN_API getTailSamples() override { return 0; }

    SpeakerArrangement known = 0;      ///< beside stereo
    SpeakerArrangement takesOther = 0; ///< for the output, though it agrees
    std::ostringstream offered;

private:
    std::map<BusDirection, std::vector<SpeakerArrangement>> m_buses = {{kInput, {0x80000, 0x3, 0x7}},
                                                                       {kOutput, {0x3}}};
};

/// What a block makes of the input positions 10, 20, …: position and channel of the plug-in that it met, at
/// each output position.
std::string blockThrough(VST3Processor &processor)
{
    ChannelBuffers buffers;
    buffers.allocate(processor.readChannels(), 1);
    for (std::size_t position = 0; position < buffers.inputCount(); ++position)
        buffers.inputs()[position][0] = static_cast<float>(10 * position);
    std::string text;
    EXPECT_TRUE(processor.process(buffers, 1));
    for (std::size_t position = 0; position < buffers.outputCount(); ++position)
        text += std::to_string(static_cast<int>(buffers.outputs()[position][0])) + ' ';
    return text;
}

} // namespace

TEST(VST3ProcessorFormats, AreOfferedAndOrderTheAudio)
{
    using namespace SpeakerArr;
    const struct {
        const char *name;
        SpeakerArrangement known, takesOther;
        int limit, input, output;
        bool accepted;
        const char *offered, *block, *ownOrder;
    } rows[] = {{"in the order of the format", k101, 0, 0, 70, 70, true, "80000 2d83f 7 > 2d83f ",
                 "0 11 22 33 44 55 67 78 89 100 106 ", "0 11 22 33 44 55 66 77 88 99 110 "},
                {"refused", 0, 0, 0, 2, 6, false, "80000 3 7 > 3f ", "0 11 ", "0 11 "},
                {"known only as discrete channels", 0x107, 0, 0, 65, 65, true,
                 "80000 f00000 7 > f00000 80000 107 7 > 107 ", "0 11 22 33 ", "0 11 22 33 "},
                {"one side in the named format", 0x107, 0, 0, 2, 65, true,
                 "80000 3 7 > f00000 80000 3 7 > 107 ", "0 11 0 0 ", "0 11 0 0 "},
                {"another than agreed", k70Music, k70Cine, 0, 9, 9, true, "80000 637 7 > 637 ",
                 "0 11 22 53 64 35 46 ", "0 11 22 33 44 55 66 "},
                {"limited", k71Music, 0, 8, 60, 60, true, "80000 63f 7 > 63f ", "0 11 22 33 44 55 66 77 ",
                 "0 11 22 33 44 55 66 77 "}};
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        Reverberator component;
        component.known = row.known;
        component.takesOther = row.takesOther;
        VST3Processor processor;
        ASSERT_TRUE(processor.attach(&component));
        processor.readChannels();
        EXPECT_EQ(processor.setFormats({row.input, row.output}, {row.limit}), row.accepted);
        EXPECT_EQ(component.offered.str(), row.offered);
        EXPECT_EQ(blockThrough(processor), row.block);
        ASSERT_TRUE(processor.attach(&component));
        EXPECT_EQ(blockThrough(processor), row.block) << "opened again";
        processor.detach();
        ASSERT_TRUE(processor.attach(&component));
        EXPECT_EQ(blockThrough(processor), row.ownOrder) << "formats are forgotten with the component";
    }
}
