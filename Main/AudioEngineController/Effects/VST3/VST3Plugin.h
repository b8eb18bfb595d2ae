#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"
#include "Main/AudioEngineController/Effects/VST3/IVST3EditOwner.h"
#include "Main/AudioEngineController/Effects/VST3/VST3HostContext.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Instance.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Module.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Processor.h"

#include <pluginterfaces/vst/ivstcomponent.h>

#include <functional>
#include <vector>

/// The records of one module's audio classes, in the factory's class order.
using ClassListing = std::vector<EffectRecord>;

/// The host's side of one VST 3 module: what lists its classes, or one instance of one of them. Used on one
/// thread, but for what the plug-in reports; whatever it takes from the plug-in is checked.
class VST3Plugin : public AudioPlugin, private IVST3EditOwner {
public:
    VST3Plugin();
    /// Closes the instance, then the module, and only then lets go of the host context that plug-ins were
    /// given.
    ~VST3Plugin() override;

    /// Called before each audio class is touched.
    void setClassObserver(std::function<void()> observer) { m_classObserver = std::move(observer); }

    /// Opens the module and lists its audio classes into `records`, which is emptied first; the module stays
    /// open. Never throws: what the plug-in throws ends the listing, and the classes listed so far stay.
    /// `factoryFound` becomes false when the module loaded but has no usable factory, and keeps the caller's
    /// value when it did not load. With `notifyEachClass`, or for a module of more than six classes, the user
    /// interface hears of each class.
    void listClasses(ClassListing &records, const QString &path, bool notifyEachClass, bool &factoryFound);

    /// Opens the record's module and makes an instance of its class, in place of one that was there. False,
    /// with the reason in the log, when that fails. What the plug-in throws that is no std::runtime_error
    /// goes on to the caller; the object can be destroyed or opened again then.
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
    struct FactoryView;

    Steinberg::tresult editGesture(Steinberg::Vst::ParamID id, bool begun) noexcept override;
    Steinberg::tresult performEdit(Steinberg::Vst::ParamID id,
                                   Steinberg::Vst::ParamValue value) noexcept override;
    Steinberg::tresult restartComponent(Steinberg::int32 flags) noexcept override;

    /// Throws std::runtime_error when the module does not load or start.
    void openModule(const QString &path);
    /// A reference to the module's factory; throws std::runtime_error when there is none that is usable.
    Steinberg::IPluginFactory *queryFactory();
    bool openInstance(const EffectRecord &record);
    bool instantiate(const EffectRecord &record);
    /// Whatever became of the start or of the call that ends the processing.
    void deactivate();
    /// Ends the instance, then the module.
    void unload();
    template <typename Call>
    bool callPlugin(const char *what, Call &&call);

    void openAndList(ClassListing &records, const QString &path, bool notifyEachClass, bool &factoryFound);
    void listModule(ClassListing &records, bool notifyEachClass, bool &factoryFound);
    void listFactory(ClassListing &records, Steinberg::IPluginFactory *factory, bool notifyEachClass);
    void listClass(ClassListing &records, FactoryView &view, Steinberg::int32 index, bool notify);
    void instantiate(ClassListing &records, const FactoryView &view, const QString &name,
                     const Steinberg::PClassInfo2 &details);
    EffectRecord describe(const FactoryView &view, const QString &name,
                          const Steinberg::PClassInfo2 &details) const;

    VST3Owned<VST3HostContext> m_hostContext;
    VST3Module m_module;
    Steinberg::Vst::IComponent *m_component =
        nullptr; ///< of the class at hand; released only after a clean listing
    Steinberg::FUID m_classId;
    VST3Instance m_instance;
    VST3Processor m_processor;
    VST3PluginSettings m_settings;
    EffectRecord m_record; ///< of the instance
    std::function<void()> m_classObserver;
};
