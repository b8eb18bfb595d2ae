#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"
#include "Main/AudioEngineController/Effects/VST3/HostObjects/IVST3EditOwner.h"
#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostContext.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Instance.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Module.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Processor.h"

/// One instance of a VST 3 class, in use. Used on one thread, but for what the plug-in reports; whatever it
/// takes from the plug-in is checked.
class VST3Plugin : public AudioPlugin, private IVST3EditOwner {
public:
    VST3Plugin() = default;
    /// Closes the instance, then the module, and only then lets go of the host context that the plug-in was
    /// given.
    ~VST3Plugin() override;

    /// Opens the record's module and makes an instance of its class, in place of one that was there. False,
    /// with the reason in the log, when that fails. Exceptions of the plug-in other than std::runtime_error
    /// reach the caller; the object can be destroyed or opened again then.
    bool openClass(const EffectRecord &record);
    /// True while there is an instance.
    bool isInstantiated() const { return m_instance.component() != nullptr; }
    const VST3Instance &instance() const { return m_instance; }

    /// Sets the bus formats (codes of `busFormats`, or discrete channels) of the main input and output of an
    /// open plug-in, which is stopped meanwhile. False when it refused and keeps a layout of its own.
    bool setBusFormats(int inputFormat, int outputFormat);
    /// Takes effect with the next bus formats.
    void setSettings(const VST3PluginSettings &settings) { m_settings = settings; }

    QString identifierPrefix() const override;
    /// The class id, as in the record.
    QString formatIdentifier() const override { return m_record.id; }
    QString name() const override { return m_record.name; }
    QString vendor() const { return m_record.vendor; }
    /// What the instance was opened with; the vendor is the factory's where the record had none.
    const EffectRecord &record() const { return m_record; }

    bool StorePreset(PluginPreset &preset) override;
    bool LoadPreset(const PluginPreset &preset) override;

protected:
    bool openPlugin(const AudioSettings &settings) override;
    bool applySettings(const AudioSettings &settings) override;
    bool startProcessing() override;
    void stopProcessing() override;
    ChannelSetup readChannels() override;
    bool processBlock(ChannelBuffers &buffers, int frames) override;

private:
    Steinberg::tresult editGesture(Steinberg::Vst::ParamID id, bool begun) noexcept override;
    Steinberg::tresult performEdit(Steinberg::Vst::ParamID id,
                                   Steinberg::Vst::ParamValue value) noexcept override;
    Steinberg::tresult restartComponent(Steinberg::int32 flags) noexcept override;

    bool createInstance(const EffectRecord &record);
    /// Whatever became of the start or of the call that ends the processing.
    void deactivate();
    /// Ends the instance, then the module.
    void unload();
    template <typename Call>
    bool callPlugin(const char *when, Call &&call);

    VST3Owned<VST3HostContext> m_hostContext; ///< outlives the module; null before the first `openClass`
    VST3Module m_module;
    VST3Instance m_instance;
    VST3Processor m_processor;
    VST3PluginSettings m_settings;
    EffectRecord m_record; ///< of the instance
};
