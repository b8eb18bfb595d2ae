#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"

#include "Core/BaseLib/Log/DebugLog.h"

#include <algorithm>
#include <cstdlib>
#include <new>

namespace {

constexpr int kMaxStoredLatency = 0xFFFF; ///< what 16 bits hold
constexpr int kLatencyShift = 16;

bool isCount(int count) { return count >= 0 && count <= AudioPlugin::kMaxChannels; }

} // namespace

bool AudioPlugin::open(const AudioSettings &settings)
{
    const TAutoLockCS lock(&m_processing);
    if (m_open)
        return setAudioSettings(settings);
    if (!isUsable(settings) || !openPlugin(settings))
        return false;
    m_open = true;
    m_settings = settings;
    setChannels(readChannels());
    if (m_bypassed)
        bypassPlugin(true);
    return true;
}

bool AudioPlugin::setAudioSettings(const AudioSettings &settings)
{
    const TAutoLockCS lock(&m_processing);
    if (!m_open || !isUsable(settings))
        return false;
    const bool wasRunning = m_running;
    stop();
    const bool applied = applySettings(settings);
    if (applied)
        m_settings = settings;
    return (!wasRunning || start()) && applied;
}

void AudioPlugin::close()
{
    const TAutoLockCS lock(&m_processing);
    stop();
    m_open = false;
}

bool AudioPlugin::start()
{
    const TAutoLockCS lock(&m_processing);
    if (m_running || !m_open)
        return m_running;
    if (!isUsable(channels()) || !startProcessing())
        return false;
    // After the call, in which the plug-in may have changed its channels; it does not run for a rebuild
    // until here.
    m_running = isUsable(channels()) && makeBuffers();
    if (!m_running)
        stopProcessing();
    return m_running;
}

bool AudioPlugin::makeBuffers()
{
    try {
        m_buffers.allocate(channels(), m_settings.blockSize);
        return true;
    } catch (const std::bad_alloc &) {
        DebugLog(L"%ls: no memory for its audio", name());
    }
    m_buffers.free();
    return false;
}

void AudioPlugin::stop()
{
    const TAutoLockCS lock(&m_processing);
    if (!m_running.exchange(false))
        return;
    stopProcessing();
    m_buffers.free();
}

bool AudioPlugin::process(int frames)
{
    const TAutoLockCS lock(&m_processing);
    if (!m_running || frames <= 0 || frames > m_buffers.frames())
        return false;
    m_buffers.silenceOutputs();
    m_inBlock = true;
    const bool processed = processBlock(m_buffers, frames);
    m_inBlock = false;
    if (!processed)
        stop();
    if (m_rebuildPending)
        rebuildChannels();
    return processed;
}

bool AudioPlugin::isUsable(const AudioSettings &settings) const
{
    const bool usable =
        settings.sampleRate > 0 && settings.blockSize > 0 && settings.blockSize <= kMaxBlockSize;
    if (!usable)
        DebugLog(L"%ls: no audio of %d Hz in blocks of %d", name(), settings.sampleRate, settings.blockSize);
    return usable;
}

bool AudioPlugin::isUsable(const ChannelSetup &channels) const
{
    const bool usable = isCount(channels.inputs.span()) && isCount(channels.outputs.span());
    if (!usable)
        DebugLog(L"%ls states %d inputs and %d outputs and cannot be used for audio", name(),
                 channels.inputs.span(), channels.outputs.span());
    return usable;
}

ChannelSetup AudioPlugin::channels() const
{
    const std::lock_guard<std::mutex> lock(m_channelsMutex);
    return m_channels;
}

void AudioPlugin::setChannels(const ChannelSetup &channels)
{
    const std::lock_guard<std::mutex> lock(m_channelsMutex);
    m_channels = channels;
}

void AudioPlugin::rebuildChannels()
{
    if (m_tornDown)
        return;
    const TAutoLockCS lock(&m_processing);
    m_rebuildPending = m_inBlock;
    if (m_tornDown || m_inBlock)
        return;
    const bool wasRunning = m_running;
    stop();
    m_buffers.free();
    setChannels(readChannels());
    tellListeners([this](IAudioPluginListener &listener) { listener.pluginChanged(*this); });
    if (wasRunning)
        start();
}

void AudioPlugin::setTornDown(bool tornDown)
{
    m_tornDown = tornDown;
    const TAutoLockCS settled(&m_processing);
}

void AudioPlugin::addListener(IAudioPluginListener *listener)
{
    const TAutoLockCS lock(&m_listening);
    if (!isListening(listener))
        m_listeners.push_back(listener);
}

void AudioPlugin::removeListener(IAudioPluginListener *listener)
{
    const TAutoLockCS lock(&m_listening);
    m_listeners.erase(std::remove(m_listeners.begin(), m_listeners.end(), listener), m_listeners.end());
}

bool AudioPlugin::isListening(const IAudioPluginListener *listener) const
{
    return std::find(m_listeners.begin(), m_listeners.end(), listener) != m_listeners.end();
}

bool AudioPlugin::setBypass(bool bypassed)
{
    m_bypassed = bypassed;
    return m_open && bypassPlugin(bypassed);
}

void AudioPlugin::storeSettings(PluginPreset &preset) const
{
    const ChannelSetup used = channels();
    preset.firstChannels = {used.inputs.first, used.outputs.first};
    preset.channelSpans = {used.inputs.span(), used.outputs.span()};
    preset.flags = (m_bypassed ? PluginPreset::kBypassed : 0) | (m_isRealtime ? PluginPreset::kRealtime : 0);
    if (!m_ownLatency)
        return;
    const int latency = std::min(std::abs(std::max(*m_ownLatency, -kMaxStoredLatency)), kMaxStoredLatency);
    preset.flags |= PluginPreset::kOwnLatency | static_cast<quint32>(latency) << kLatencyShift;
}

void AudioPlugin::loadSettings(const PluginPreset &preset)
{
    const bool bypassed = (preset.flags & PluginPreset::kBypassed) != 0;
    if (bypassed != m_bypassed)
        setBypass(bypassed);
    m_isRealtime = (preset.flags & PluginPreset::kRealtime) != 0;
    m_ownLatency.reset();
    if (preset.flags & PluginPreset::kOwnLatency)
        m_ownLatency = static_cast<int>(preset.flags >> kLatencyShift);
}
