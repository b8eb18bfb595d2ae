#pragma once

#include "Main/AudioEngineController/Effects/AudioPluginHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTInterface.h"

#include <atomic>
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
    /// As in every format; but of two files of the special shells that offer the same sub-plug-in, the one of
    /// the higher version stays.
    bool AddEffect(const EffectRecord &record) override;
    /// Loads a plug-in of the effect list by its identifier, for use. Null when it is not there, disabled, of
    /// a kind that is not loaded, or fails to load. A key of an earlier naming ("Waves " and the name) is
    /// tried again without its start.
    std::unique_ptr<VSTPlugin> loadByKey(const QString &key);

    void setAudioSettings(int sampleRate, int blockSize) override;
    /// In Hz.
    int sampleRate() const { return m_sampleRate; }
    /// In samples.
    int blockSize() const { return m_blockSize; }
    VstInt32 processLevel() const { return m_processLevel; }
    VstTimeInfo *timeInfo() const { return m_timeInfo; }

    /// The plug-in whose entry point is being called; a single slot, loads do not nest.
    void setPluginBeingLoaded(VSTPlugin *plugin) { m_pluginBeingLoaded = plugin; }
    /// Its sub-plug-in identifier; false when no plug-in is being loaded.
    bool shellIdOfPluginBeingLoaded(VstInt32 &id) const;
    /// Notifications from this plug-in are dropped; null: from none.
    void setIgnoredPlugin(VSTPlugin *plugin) { m_ignoredPlugin = plugin; }
    bool isIgnored(const VSTPlugin *plugin) const { return plugin == m_ignoredPlugin; }

    void registerPlugin(VSTPlugin *plugin);
    void unregisterPlugin(VSTPlugin *plugin);
    /// Calls the operation with the plug-in object that an effect names as its owner; false, without a call,
    /// for a null effect and for one whose owner is no plug-in of ours. The list lock is held meanwhile, so
    /// that the object lives: the operation must not call plug-in code.
    template <typename Operation>
    bool withCallingPlugin(const AEffect *effect, Operation &&operation)
    {
        VSTPlugin *const claimed = effect ? reinterpret_cast<VSTPlugin *>(effect->resvd1) : nullptr;
        const std::lock_guard<std::mutex> lock(m_pluginsMutex);
        if (!isRegistered(claimed))
            return false;
        operation(*claimed);
        return true;
    }
    /// Logs the names of all plug-in objects.
    void logLoadedPlugins() const;

private:
    bool isRegistered(const VSTPlugin *plugin) const;
    bool cleanUpNames();

    std::atomic<int> m_blockSize{256};
    std::atomic<int> m_sampleRate{44100};
    std::atomic<VSTPlugin *> m_pluginBeingLoaded{nullptr};
    std::atomic<VSTPlugin *> m_ignoredPlugin{nullptr};
    VstTimeInfo *m_timeInfo = nullptr; ///< not owned; the scanner has none
    VstInt32 m_processLevel = VstPublished::kVstProcessLevelUser;
    mutable std::mutex m_pluginsMutex;
    std::vector<VSTPlugin *> m_plugins; ///< not owned
};

/// The version in the file name of one of the special shells ("WaveShell1-VST 9.3_x64.dll" gives 9.3; the
/// platform's own ending); 0 for any other name.
double waveShellVersion(const QString &fileName);
