#pragma once

#include "Core/BaseLib/Process/KriticalSection.h"
#include "Main/AudioEngineController/Effects/Plugin/ChannelBuffers.h"
#include "Main/AudioEngineController/Effects/Plugin/PluginPreset.h"

#include <QString>

#include <atomic>
#include <memory>
#include <mutex>
#include <optional>
#include <vector>

class AudioPlugin;

/// What a plug-in is told about the audio that it is used for.
struct AudioSettings {
    int sampleRate; ///< Hz
    int blockSize;  ///< samples, the most of one call
};

/// Hears what happens to a plug-in, on whatever thread it happens. It must not throw, and not stop or destroy
/// the plug-in: plug-in code may be on the stack.
class IAudioPluginListener {
public:
    /// Channels, latency or state are not what they were.
    virtual void pluginChanged(AudioPlugin &plugin) noexcept = 0;
    /// Programs or the texts of parameters are to be shown anew.
    virtual void displayChanged(AudioPlugin & /*plugin*/) noexcept {}
    virtual void parameterChanged(AudioPlugin & /*plugin*/, quint32 /*id*/, double /*value*/) noexcept {}
    /// A parameter is taken hold of (`begins`) or let go.
    virtual void parameterEdit(AudioPlugin & /*plugin*/, quint32 /*id*/, bool /*begins*/) noexcept {}
    /// The editor wants another size, in pixels; true when it got it.
    virtual bool resizeEditor(AudioPlugin & /*plugin*/, int /*width*/, int /*height*/) noexcept
    {
        return false;
    }

protected:
    ~IAudioPluginListener() = default;
};

/// A plug-in as the rest of the application uses it, whatever its format.
///
/// Life: made and loaded by its host, `open`, `start` and `stop` any number of times, `close`. One thread
/// does that; what a plug-in reports may come from any. The processing lock is held while the audio's state
/// changes or a block is processed; the listener lock is taken after it, never before: a listener must not
/// wait for a block.
class AudioPlugin {
public:
    /// More channels than any plug-in has in one direction. One that states more cannot be used for audio:
    /// it would write past the channels that it is given.
    static constexpr int kMaxChannels = 1024;
    /// More samples than any block has.
    static constexpr int kMaxBlockSize = 1 << 20;

    virtual ~AudioPlugin() = default;
    AudioPlugin(const AudioPlugin &) = delete;
    AudioPlugin &operator=(const AudioPlugin &) = delete;

    /// The prefix of its format's identifiers.
    virtual QString identifierPrefix() const = 0;
    /// Its identifier in the catalogue of its format.
    virtual QString formatIdentifier() const = 0;
    virtual QString name() const = 0;
    /// The identifier by which it is loaded again.
    QString identifier() const { return identifierPrefix() + formatIdentifier(); }

    /// Prepares a loaded plug-in for audio. False, with the reason in the log, when it cannot be.
    bool open(const AudioSettings &settings);
    /// Tells an open plug-in other settings; a running one is stopped meanwhile.
    bool setAudioSettings(const AudioSettings &settings);
    /// Ends the use for audio. What a format adds to it must end in this.
    virtual void close();
    /// Switches processing on; true when it is on then.
    bool start();
    void stop();
    /// Processes one block of at most the size that the plug-in was opened with, from the buffers' inputs to
    /// their outputs. False when it does not run or the block failed; it is stopped then.
    bool process(int frames);
    /// The audio of a running plug-in; empty otherwise. Only between blocks.
    ChannelBuffers &buffers() { return m_buffers; }
    bool isOpen() const { return m_open; }
    bool isRunning() const { return m_running; }

    /// The channels as last read from the plug-in. Waits for no block, so a listener may ask.
    ChannelSetup channels() const;
    /// Reads the channels anew because the plug-in says that they changed: stops it if it runs, frees the
    /// buffers, reads, tells the listeners, starts it again. Nothing while it is being torn down. Any thread,
    /// also from inside a call of the plug-in; from inside a block it happens after the block.
    void rebuildChannels();

    /// Captures the state; false when nothing was stored.
    virtual bool StorePreset(PluginPreset &preset) = 0;
    /// Brings a captured state back; false, with the reason in the log, when the preset is of another plug-in
    /// or damaged. Nothing of the plug-in is touched then.
    virtual bool LoadPreset(const PluginPreset &preset) = 0;

    void addListener(IAudioPluginListener *listener);
    /// After it returned the listener hears nothing more.
    void removeListener(IAudioPluginListener *listener);

    /// Switches the plug-in's effect off and on; false when it cannot do so itself.
    bool setBypass(bool bypassed);
    bool isBypassed() const { return m_bypassed; }
    /// Whether it is processed on the thread of the audio device.
    void setRealtime(bool realtime) { m_isRealtime = realtime; }
    bool isRealtime() const { return m_isRealtime; }
    /// A latency in samples that the user set in place of the stated one.
    void setOwnLatency(std::optional<int> samples) { m_ownLatency = samples; }
    std::optional<int> ownLatency() const { return m_ownLatency; }

protected:
    AudioPlugin() = default;

    /// The format's part of the operations above; called with the processing lock held.
    virtual bool openPlugin(const AudioSettings &settings) = 0;
    virtual bool applySettings(const AudioSettings &settings) = 0;
    virtual bool startProcessing() = 0;
    virtual void stopProcessing() = 0;
    virtual ChannelSetup readChannels() = 0;
    /// One block; the outputs are silent before.
    virtual bool processBlock(ChannelBuffers & /*buffers*/, int /*frames*/) { return false; }
    virtual bool bypassPlugin(bool /*bypassed*/) { return false; }

    /// From here on (until set back) nothing that the plug-in reports changes it; returns when a rebuild
    /// under way has ended. A destructor sets it first.
    void setTornDown(bool tornDown);
    /// Calls each listener, under the listener lock.
    template <typename Tell>
    void tellListeners(Tell &&tell)
    {
        const TAutoLockCS lock(&m_listening);
        const std::vector<IAudioPluginListener *> all = m_listeners; // one may leave meanwhile
        for (IAudioPluginListener *listener : all)
            if (isListening(listener))
                tell(*listener);
    }
    /// The settings of this object that a preset carries, and back.
    void storeSettings(PluginPreset &preset) const;
    void loadSettings(const PluginPreset &preset);

    KriticalSection &processingLock() const { return m_processing; }

private:
    bool isListening(const IAudioPluginListener *listener) const;
    bool isUsable(const AudioSettings &settings) const;
    bool isUsable(const ChannelSetup &channels) const;
    bool makeBuffers();
    void setChannels(const ChannelSetup &channels);

    mutable KriticalSection m_processing;
    KriticalSection m_listening;
    std::vector<IAudioPluginListener *> m_listeners; ///< not owned
    AudioSettings m_settings = {0, 0};
    ChannelSetup m_channels;
    mutable std::mutex m_channelsMutex; ///< nothing is called under it
    ChannelBuffers m_buffers;
    bool m_inBlock = false;        ///< the plug-in works on the buffers
    bool m_rebuildPending = false; ///< asked for meanwhile
    std::atomic<bool> m_tornDown{false};
    std::atomic<bool> m_open{false};
    std::atomic<bool> m_running{false};
    std::atomic<bool> m_bypassed{false};
    std::atomic<bool> m_isRealtime{false};
    std::optional<int> m_ownLatency;
};

/// What came of loading a plug-in by its identifier.
struct LoadedPlugin {
    bool isKnown = false;                ///< the host's effect list has the identifier
    std::unique_ptr<AudioPlugin> plugin; ///< null when it is switched off or failed to load; the log says why
};
