#pragma once

#include "Main/AudioEngineController/Effects/VST/Interface/VSTInterface.h"

#include <QString>

/// Whoever holds an effect: the host callback asks it what concerns this one plug-in, and reports to it.
///
/// The plug-in decides on which thread. None of these may throw: plug-in code is on the stack.
class IVSTEffectOwner {
public:
    /// The plug-in's name, for the log.
    virtual QString name() const = 0;
    /// Identifier of the sub-plug-in that the module's entry point is to make, as the plug-in sees it; 0:
    /// none.
    virtual VstInt32 shellId() const = 0;
    /// Whether it is processed on the thread of the audio device.
    virtual bool isRealtime() const { return false; }

    virtual void setNeedsIdle() {}
    virtual void setWantsMidi() {}
    /// The effect's channels or latency changed.
    virtual void ioChanged() {}
    /// True when the editor got that size, in pixels.
    virtual bool resizeEditor(VstInt32 /*width*/, VstInt32 /*height*/) { return false; }
    virtual void parameterChanged(VstInt32 /*index*/, float /*value*/) {}
    /// The user takes hold of a parameter (`begins`) or lets it go.
    virtual void parameterEdit(VstInt32 /*index*/, bool /*begins*/) {}
    /// Programs or the texts of parameters are to be shown anew.
    virtual void refreshDisplay() {}

protected:
    ~IVSTEffectOwner() = default;
};
