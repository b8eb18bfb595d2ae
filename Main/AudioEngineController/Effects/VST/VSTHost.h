#pragma once

#include "Main/AudioEngineController/Effects/Host/CatalogueHost.h"

#include <memory>

class VSTPlugin;

/// The host of VST 2 plug-ins: their catalogue, and those loaded for use. What plug-ins ask and report goes
/// to `VSTHostContext`.
class VSTHost : public CatalogueHost {
public:
    VSTHost();

    bool Scan(bool scan, bool inProcess) override;
    /// As in every format; but of two files of the special shells that offer the same sub-plug-in, the one of
    /// the higher version stays.
    bool AddEffect(const EffectRecord &record) override;
    /// Loads a plug-in of the effect list by its identifier, for use. Null when it is not there, disabled, of
    /// a kind that is not loaded, or fails to load. A key of an earlier naming ("Waves " and the name) is
    /// tried again without its start.
    std::unique_ptr<VSTPlugin> loadByKey(const QString &key);
    LoadedPlugin loadPlugin(const QString &identifier) override;

    void setAudioSettings(int sampleRate, int blockSize) override;
    std::unique_ptr<IPluginProbe> makeProbe() const override;

private:
    std::optional<EffectRecord> findByKey(QString key) const;
    std::unique_ptr<VSTPlugin> loadRecord(const EffectRecord &record, const QString &requestedKey);
    bool cleanUpNames();
};

/// The version in the file name of one of the special shells ("WaveShell1-VST 9.3_x64.dll" gives 9.3; the
/// platform's own ending); 0 for any other name.
double waveShellVersion(const QString &fileName);
