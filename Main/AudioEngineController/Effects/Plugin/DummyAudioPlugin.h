#pragma once

#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"

/// Stands for a plug-in that is missing, so that a project keeps its place, its name and its state until the
/// plug-in is back. It has no audio of its own.
class DummyAudioPlugin : public AudioPlugin {
public:
    /// `identifier` is the missing plug-in's, with the prefix of its format.
    explicit DummyAudioPlugin(const QString &identifier, const QString &name = QString());

    QString identifierPrefix() const override;
    /// The missing plug-in's whole identifier.
    QString formatIdentifier() const override { return m_missing; }
    QString name() const override { return m_name; }

    /// Gives back the preset that was loaded, unchanged; false before one was.
    bool StorePreset(PluginPreset &preset) override;
    /// Keeps the missing plug-in's preset; refuses that of another one.
    bool LoadPreset(const PluginPreset &preset) override;

protected:
    bool openPlugin(const AudioSettings &) override { return true; }
    bool applySettings(const AudioSettings &) override { return true; }
    bool startProcessing() override { return true; }
    void stopProcessing() override {}
    /// Those of the preset, as far as a plug-in can have them.
    ChannelSetup readChannels() override;

private:
    QString m_missing;
    QString m_name;
    std::optional<PluginPreset> m_preset;
};
