#pragma once

#include <pluginterfaces/base/funknown.h>
#include <pluginterfaces/vst/vsttypes.h>

namespace Steinberg {
class IPlugView;
namespace Vst {
class IContextMenu;
} // namespace Vst
} // namespace Steinberg

/// Receives what a plug-in tells its host context, on the thread that the plug-in chose. Every argument is
/// the plug-in's, unchecked; the result is what the plug-in gets to see.
///
/// Only the edits of parameters must be handled. What an owner leaves alone is answered as without an owner.
class IVST3EditOwner {
public:
    /// A parameter is taken hold of (`begun`) or let go.
    virtual Steinberg::tresult editGesture(Steinberg::Vst::ParamID id, bool begun) noexcept = 0;
    /// A parameter has a new value, 0 to 1.
    virtual Steinberg::tresult performEdit(Steinberg::Vst::ParamID id,
                                           Steinberg::Vst::ParamValue value) noexcept = 0;

    /// Edits that belong together begin (`begun`) or have ended.
    virtual Steinberg::tresult groupEdit(bool /*begun*/) noexcept { return Steinberg::kResultFalse; }
    virtual Steinberg::tresult restartComponent(Steinberg::int32 /*flags*/) noexcept
    {
        return Steinberg::kResultFalse;
    }
    virtual Steinberg::tresult setDirty(Steinberg::TBool /*state*/) noexcept
    {
        return Steinberg::kResultFalse;
    }
    virtual Steinberg::tresult requestOpenEditor(Steinberg::FIDString /*name*/) noexcept
    {
        return Steinberg::kResultFalse;
    }
    /// Null: no menu. The plug-in gets the menu with a reference.
    virtual Steinberg::Vst::IContextMenu *createContextMenu(Steinberg::IPlugView * /*view*/,
                                                            const Steinberg::Vst::ParamID * /*id*/) noexcept
    {
        return nullptr;
    }
    virtual Steinberg::tresult executeMenuItem(Steinberg::int32 /*tag*/) noexcept
    {
        return Steinberg::kResultFalse;
    }
    virtual Steinberg::tresult notifyUnitSelection(Steinberg::Vst::UnitID /*unit*/) noexcept
    {
        return Steinberg::kResultFalse;
    }
    virtual Steinberg::tresult notifyProgramListChange(Steinberg::Vst::ProgramListID /*list*/,
                                                       Steinberg::int32 /*programIndex*/) noexcept
    {
        return Steinberg::kResultFalse;
    }
    virtual Steinberg::tresult requestBusActivation(Steinberg::Vst::MediaType /*type*/,
                                                    Steinberg::Vst::BusDirection /*direction*/,
                                                    Steinberg::int32 /*index*/,
                                                    Steinberg::TBool /*state*/) noexcept
    {
        return Steinberg::kResultFalse;
    }

protected:
    ~IVST3EditOwner() = default;
};
