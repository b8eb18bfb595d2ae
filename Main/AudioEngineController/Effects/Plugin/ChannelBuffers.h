#pragma once

#include <algorithm>
#include <cstddef>
#include <vector>

/// The channels in use of one direction, counted from 0.
struct ChannelRange {
    int first = 0;
    int last = -1; ///< below `first`: none

    int span() const { return last - first + 1; }
};

/// The channels of a plug-in.
struct ChannelSetup {
    ChannelRange inputs;
    ChannelRange outputs;
};

/// The audio of one block, channel by channel, as plug-ins are handed it. Guarded by the processing lock of
/// the plug-in that it belongs to.
class ChannelBuffers {
public:
    /// Makes room for `frames` samples in each channel, all silent. Throws std::bad_alloc.
    void allocate(const ChannelSetup &channels, int frames)
    {
        m_frames = frames;
        const auto inputs = static_cast<std::size_t>(channels.inputs.span());
        const auto all = inputs + static_cast<std::size_t>(channels.outputs.span());
        m_samples.assign(all * static_cast<std::size_t>(frames), 0.0f);
        m_channels.resize(all);
        for (std::size_t channel = 0; channel < all; ++channel)
            m_channels[channel] = m_samples.data() + channel * static_cast<std::size_t>(frames);
        m_inputs = inputs;
    }
    void silenceOutputs()
    {
        std::fill(m_samples.begin() + static_cast<std::ptrdiff_t>(m_inputs) * m_frames, m_samples.end(),
                  0.0f);
    }
    void free() { *this = ChannelBuffers(); }

    int frames() const { return m_frames; }
    std::size_t inputCount() const { return m_inputs; }
    std::size_t outputCount() const { return m_channels.size() - m_inputs; }
    /// One pointer for each channel.
    float **inputs() { return m_channels.data(); }
    float **outputs() { return m_channels.data() + m_inputs; }

private:
    int m_frames = 0;
    std::size_t m_inputs = 0;
    std::vector<float> m_samples;
    std::vector<float *> m_channels;
};
