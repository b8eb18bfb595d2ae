#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"
#include "Main/AudioEngineController/Effects/VST/Interface/IVSTEffectOwner.h"
#include "Main/AudioEngineController/Effects/VST/VSTEditor.h"
#include "Main/AudioEngineController/Effects/VST/VSTModule.h"
#include "Main/AudioEngineController/Effects/VST/VSTPresets.h"
#include "Main/AudioEngineController/Effects/VST/VSTPrograms.h"
#include "Main/AudioEngineController/Effects/VST/VSTSpeakerLink.h"

#include <atomic>

/// A VST 2 plug-in in use. Loading and destruction happen on one thread; what the host callback reports may
/// come from any. Every call of the plug-in is guarded. One that committed a hardware fault is called no
/// more.
class VSTPlugin : public AudioPlugin, public IVSTEffectOwner {
public:
    VSTPlugin();
    /// Releases the plug-in and unloads its module.
    ~VSTPlugin() override;

    /// Loads a catalogued plug-in or a sub-plug-in of a shell; false, with log lines, when that fails. With
    /// reload mode 0 what was held is closed and unloaded before; with mode 1 the module stays and its entry
    /// point is called again.
    bool load(const EffectRecord &record, VSTHostCallbackFunction callback, int reloadMode);

    QString name() const override { return m_naming.name; }
    /// Name, colon and unique id: the identifier in the catalogue.
    const QString &key() const { return m_naming.key; }
    QString identifierPrefix() const override;
    QString formatIdentifier() const override { return m_naming.key; }
    /// The key under which it was asked for, where that is an earlier one; presets may still carry it.
    void setRequestedKey(const QString &key) { m_requestedKey = key; }

    void close() override;
    /// Hands MIDI events over; false when the plug-in does not take any.
    bool processEvents(VstEvents &events);
    /// Announces how many samples will be processed in all, where that is known.
    void setTotalSamples(qint64 samples);
    /// To be called some ten times a second while the plug-in is in use.
    void idle();

    /// Tells an open plug-in the speakers of its channels: those of the bus formats of as many channels as
    /// asked for, as far as they suit the channels that the plug-in states. Best before it is started.
    /// Nothing is sent while the plug-in knows and still has the channels that it stated last, unless
    /// `force` is set. True when the plug-in accepted; otherwise it keeps a layout of its own.
    bool UpdateSpeakerArrangement(int inputs, int outputs, bool force);

    /// Opens the editor of an open plug-in in a window of the system, which stays the caller's.
    bool openEditor(void *window) { return isOpen() && m_editor.open(window); }
    VSTEditor &editor() { return m_editor; }
    VSTPrograms &programs() { return m_programs; }
    const VSTParameters &parameters() const { return m_parameters; }

    bool StorePreset(PluginPreset &preset) override;
    bool LoadPreset(const PluginPreset &preset) override;

    VstInt32 shellId() const override { return m_shellId; }
    bool isRealtime() const override { return AudioPlugin::isRealtime(); }
    void setNeedsIdle() override { m_needsIdle = true; }
    void setWantsMidi() override { m_wantsMidi = true; }
    void ioChanged() override;
    /// True when the editor is open and a listener gave it that size.
    bool resizeEditor(VstInt32 width, VstInt32 height) override;
    void parameterChanged(VstInt32 index, float value) override;
    void parameterEdit(VstInt32 index, bool begins) override;
    void refreshDisplay() override;

protected:
    bool openPlugin(const AudioSettings &settings) override;
    bool applySettings(const AudioSettings &settings) override;
    bool startProcessing() override;
    void stopProcessing() override;
    ChannelSetup readChannels() override;
    bool processBlock(ChannelBuffers &buffers, int frames) override
    {
        return m_effect.isCallable() && m_effect.process(buffers, frames);
    }
    bool bypassPlugin(bool bypassed) override;

private:
    VSTLoadResult enter(const QString &path, VSTHostCallbackFunction callback);
    /// Makes another effect, or none, the one at hand.
    void adopt(const VSTEffect &effect);
    void unload();
    bool canDo(const char *capability);

    VSTModule m_module;
    VSTEffect m_effect;
    VSTNaming m_naming;
    VSTParameters m_parameters{m_effect, m_naming};
    VSTPresets m_presets{m_effect, m_naming, m_parameters};
    VSTPrograms m_programs{m_effect};
    VSTEditor m_editor{m_effect};
    VSTSpeakerLink m_speakers{m_effect, m_naming};
    std::atomic<VstInt32> m_shellId{0};
    QString m_requestedKey; ///< empty: its own
    std::atomic<bool> m_needsIdle{false};
    std::atomic<bool> m_wantsMidi{false};
    int m_toldSampleRate = 0;    ///< since it was opened, in Hz; 0: none yet
    bool m_effectOpened = false; ///< `effOpen` was sent to the effect at hand
    bool m_canBypass = false;
    bool m_takesMidi = false;
};
