#pragma once

#include "Main/AudioEngineController/Effects/Host/AudioPluginHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTSpeakers.h"

#include <atomic>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <vector>

class VSTPlugin;

/// The host of VST 2 plug-ins, and the settings that the host callback answers from.
class VSTHost : public AudioPluginHost {
public:
    VSTHost();
    ~VSTHost() override;

    /// The process's host: the first one made that still lives, made now when there is none.
    static VSTHost &instance();

    bool Scan(bool scan, bool inProcess) override;
    QString moduleEnding() const override;
    /// As in every format; but of two files of the special shells that offer the same sub-plug-in, the one of
    /// the higher version stays.
    bool AddEffect(const EffectRecord &record) override;
    /// Loads a plug-in of the effect list by its identifier, for use. Null when it is not there, disabled, of
    /// a kind that is not loaded, or fails to load. A key of an earlier naming ("Waves " and the name) is
    /// tried again without its start.
    std::unique_ptr<VSTPlugin> loadByKey(const QString &key);
    LoadedPlugin loadPlugin(const QString &identifier) override;

    void setAudioSettings(int sampleRate, int blockSize) override;
    /// In Hz.
    int sampleRate() const { return m_sampleRate; }
    /// In samples.
    int blockSize() const { return m_blockSize; }
    VstInt32 processLevel() const { return m_processLevel; }
    VstTimeInfo *timeInfo() const { return m_timeInfo; }

    /// The arrangement that is ready for exactly that many channels, also printed; null when there is none.
    const VSTSpeakerArrangement *findArrangement(int channels) const;
    /// The channels of the bus format of that many; 0 when there is none.
    int busFormatChannels(int channels) const { return m_arrangements.count(channels) != 0 ? channels : 0; }

    /// The plug-in whose entry point is being called; a single slot, loads do not nest.
    void setPluginBeingLoaded(VSTPlugin *plugin) { m_pluginBeingLoaded = plugin; }
    /// Its sub-plug-in identifier; false when no plug-in is being loaded.
    bool shellIdOfPluginBeingLoaded(VstInt32 &id) const;
    /// Notifications from this plug-in are dropped; null: from none.
    void setIgnoredPlugin(VSTPlugin *plugin) { m_ignoredPlugin = plugin; }
    /// Drops them no more, unless another plug-in took its place meanwhile.
    void stopIgnoring(VSTPlugin *plugin) { m_ignoredPlugin.compare_exchange_strong(plugin, nullptr); }
    bool isIgnored(const VSTPlugin *plugin) const { return plugin == m_ignoredPlugin; }

    void registerPlugin(VSTPlugin *plugin);
    /// Waits until nobody works with the plug-in object any more; so not to be called from inside such work.
    void unregisterPlugin(VSTPlugin *plugin);
    /// Calls the operation with the plug-in object that an effect names as its owner; false, without a call,
    /// for a null effect and for one whose owner is no plug-in of ours. The object lives at least as long as
    /// the operation, which may call plug-in code but must not throw.
    template <typename Operation>
    bool withCallingPlugin(const AEffect *effect, Operation &&operation)
    {
        const Pin pin(*this, effect ? reinterpret_cast<VSTPlugin *>(effect->resvd1) : nullptr);
        if (!pin.plugin())
            return false;
        operation(*pin.plugin());
        return true;
    }
    /// Logs the names of all plug-in objects.
    void logLoadedPlugins() const;

private:
    /// A plug-in object, and how many calls work with it.
    struct Registered {
        VSTPlugin *plugin; ///< not owned
        int pins;
    };

    /// Keeps a plug-in object alive for a scope, also when the thread is ended in it.
    class Pin {
    public:
        Pin(VSTHost &host, VSTPlugin *claimed)
            : m_host(host)
            , m_plugin(host.pin(claimed) ? claimed : nullptr)
        {}
        ~Pin()
        {
            if (m_plugin)
                m_host.unpin(m_plugin);
        }
        Pin(const Pin &) = delete;
        Pin &operator=(const Pin &) = delete;

        /// Null when it is none of ours.
        VSTPlugin *plugin() const { return m_plugin; }

    private:
        VSTHost &m_host;
        VSTPlugin *m_plugin;
    };

    std::vector<Registered>::iterator registered(const VSTPlugin *plugin);
    bool pin(const VSTPlugin *claimed);
    void unpin(const VSTPlugin *plugin);
    std::optional<EffectRecord> findByKey(QString key) const;
    std::unique_ptr<VSTPlugin> loadRecord(const EffectRecord &record, const QString &requestedKey);
    bool cleanUpNames();

    std::atomic<int> m_blockSize{256};
    std::atomic<int> m_sampleRate{44100};
    std::atomic<VSTPlugin *> m_pluginBeingLoaded{nullptr};
    std::atomic<VSTPlugin *> m_ignoredPlugin{nullptr};
    VstTimeInfo *m_timeInfo = nullptr; ///< not owned; the scanner has none
    VstInt32 m_processLevel = VstPublished::kVstProcessLevelUser;
    const VSTArrangementTable m_arrangements = vstArrangementTable();
    mutable std::mutex m_pluginsMutex;
    std::condition_variable m_unpinned;
    std::vector<Registered> m_plugins;
};

/// The version in the file name of one of the special shells ("WaveShell1-VST 9.3_x64.dll" gives 9.3; the
/// platform's own ending); 0 for any other name.
double waveShellVersion(const QString &fileName);
