#pragma once

#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostAttributeList.h"

#include <pluginterfaces/vst/ivstcontextmenu.h>
#include <pluginterfaces/vst/ivsteditcontroller.h>
#include <pluginterfaces/vst/ivsthostapplication.h>
#include <pluginterfaces/vst/ivstunits.h>

#include <atomic>

class IVST3EditOwner;

/// The host as one plug-in instance sees it: what `initialize` is given. Scan worker thread, no lock; the
/// reference count is safe anywhere. Nothing throws.
///
/// Made by `createOwned(owner)`; the owner is null while a module is only being listed, and then every call
/// that it would receive is answered with `kResultFalse`. The owner holds the context and outlives it; a
/// plug-in that keeps the context longer finds it without an owner.
class VST3HostContext final
    : public VST3HostObject<VST3HostContext, Steinberg::Vst::IComponentHandler,
                            Steinberg::Vst::IComponentHandler2, Steinberg::Vst::IComponentHandler3,
                            Steinberg::Vst::IContextMenuTarget, Steinberg::Vst::IHostApplication,
                            Steinberg::Vst::IUnitHandler, Steinberg::Vst::IComponentHandlerBusActivation> {
public:
    /// Throws std::bad_alloc.
    VST3HostContext(VST3Holder holder, IVST3EditOwner *owner);

    /// As for every host object; `IAttributeList` is answered with the context's own list, no reference
    /// added.
    Steinberg::tresult PLUGIN_API queryInterface(const Steinberg::TUID interfaceId, void **obj) override;
    /// Hides the base's: the owner goes with its reference.
    void letGo() noexcept;

    Steinberg::tresult PLUGIN_API beginEdit(Steinberg::Vst::ParamID id) override;
    Steinberg::tresult PLUGIN_API performEdit(Steinberg::Vst::ParamID id,
                                              Steinberg::Vst::ParamValue value) override;
    Steinberg::tresult PLUGIN_API endEdit(Steinberg::Vst::ParamID id) override;
    Steinberg::tresult PLUGIN_API restartComponent(Steinberg::int32 flags) override;

    Steinberg::tresult PLUGIN_API setDirty(Steinberg::TBool state) override;
    Steinberg::tresult PLUGIN_API requestOpenEditor(Steinberg::FIDString name) override;
    Steinberg::tresult PLUGIN_API startGroupEdit() override;
    Steinberg::tresult PLUGIN_API finishGroupEdit() override;

    /// Null without an owner.
    Steinberg::Vst::IContextMenu *PLUGIN_API createContextMenu(Steinberg::IPlugView *view,
                                                               const Steinberg::Vst::ParamID *id) override;
    Steinberg::tresult PLUGIN_API executeMenuItem(Steinberg::int32 tag) override;

    /// Writes the host's name and a terminator.
    Steinberg::tresult PLUGIN_API getName(Steinberg::Vst::String128 name) override;
    /// A new message or attribute list with one reference, the caller's; null and `kNoInterface` for any
    /// other class, or an interface that the class has not.
    Steinberg::tresult PLUGIN_API createInstance(Steinberg::TUID classId, Steinberg::TUID interfaceId,
                                                 void **obj) override;

    Steinberg::tresult PLUGIN_API notifyUnitSelection(Steinberg::Vst::UnitID unit) override;
    Steinberg::tresult PLUGIN_API notifyProgramListChange(Steinberg::Vst::ProgramListID list,
                                                          Steinberg::int32 programIndex) override;

    Steinberg::tresult PLUGIN_API requestBusActivation(Steinberg::Vst::MediaType type,
                                                       Steinberg::Vst::BusDirection direction,
                                                       Steinberg::int32 index,
                                                       Steinberg::TBool state) override;

private:
    friend VST3HostObject;

    ~VST3HostContext() = default;

    template <typename... Parameters>
    Steinberg::tresult forward(Steinberg::tresult (IVST3EditOwner::*operation)(Parameters...) noexcept,
                               Parameters... arguments) noexcept;

    std::atomic<IVST3EditOwner *> m_owner;
    VST3Owned<VST3HostAttributeList> m_attributes;
};
