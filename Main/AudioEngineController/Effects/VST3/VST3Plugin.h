#pragma once

#include "Main/AudioEngineController/Effects/EffectRecord.h"
#include "Main/AudioEngineController/Effects/VST3/VST3HostContext.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Module.h"

#include <pluginterfaces/vst/ivstcomponent.h>

#include <functional>
#include <vector>

/// The records of one module's audio classes, in the factory's class order.
using ClassListing = std::vector<EffectRecord>;

/// The host's side of one VST 3 module. Used on one thread; whatever it takes from the plug-in is checked.
class VST3Plugin {
public:
    VST3Plugin();
    /// Closes the module, and only then lets go of the host context that plug-ins were given.
    ~VST3Plugin();
    VST3Plugin(const VST3Plugin &) = delete;
    VST3Plugin &operator=(const VST3Plugin &) = delete;

    /// Called before each audio class is touched.
    void setClassObserver(std::function<void()> observer) { m_classObserver = std::move(observer); }

    /// Opens the module and lists its audio classes into `records`, which is emptied first; the module stays
    /// open. Never throws: what the plug-in throws ends the listing, and the classes listed so far stay.
    /// `factoryFound` becomes false when the module loaded but has no usable factory, and keeps the caller's
    /// value when it did not load. With `notifyEachClass`, or for a module of more than six classes, the user
    /// interface hears of each class.
    void listClasses(ClassListing &records, const QString &path, bool notifyEachClass, bool &factoryFound);

private:
    struct FactoryView;

    void openAndList(ClassListing &records, const QString &path, bool notifyEachClass, bool &factoryFound);
    void listModule(ClassListing &records, Steinberg::IPluginFactory *module, bool notifyEachClass,
                    bool &factoryFound);
    void listFactory(ClassListing &records, Steinberg::IPluginFactory *factory, bool notifyEachClass);
    void listClass(ClassListing &records, FactoryView &view, Steinberg::int32 index, bool notify);
    void instantiate(ClassListing &records, const FactoryView &view, const QString &name,
                     const Steinberg::PClassInfo2 &details);
    EffectRecord describe(const FactoryView &view, const QString &name,
                          const Steinberg::PClassInfo2 &details) const;
    Steinberg::int32 channelCount(Steinberg::Vst::BusDirection direction) const;

    VST3Owned<VST3HostContext> m_hostContext;
    VST3Module m_module;
    Steinberg::Vst::IComponent *m_component =
        nullptr; ///< of the class at hand; released only after a clean listing
    Steinberg::FUID m_classId;
    bool m_instantiated = false;
    std::function<void()> m_classObserver;
};
