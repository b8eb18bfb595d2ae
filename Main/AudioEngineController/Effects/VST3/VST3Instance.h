#pragma once

#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostContext.h"

#include <QByteArray>

#include <pluginterfaces/base/ipluginbase.h>
#include <pluginterfaces/base/smartpointer.h>
#include <pluginterfaces/vst/ivstcomponent.h>
#include <pluginterfaces/vst/ivsteditcontroller.h>
#include <pluginterfaces/vst/ivstmessage.h>

/// One instance of a class: its component and its edit controller, which may be the same object. Used on one
/// thread. Exceptions of the plug-in leave `create`, after which the instance is to be closed, and the
/// operations on state; an object that threw before it was initialised is not called again.
class VST3Instance {
public:
    VST3Instance() = default;
    /// Closes it.
    ~VST3Instance();
    VST3Instance(const VST3Instance &) = delete;
    VST3Instance &operator=(const VST3Instance &) = delete;

    /// Makes and initialises the component and finds its controller. False, with the reason in the log, when
    /// there is no component that could start; one whose `initialize` failed is never called again, not even
    /// to be released. A controller that cannot be had is logged, and the instance does without.
    /// The factory and the context must outlive the instance.
    bool create(Steinberg::IPluginFactory *factory, const Steinberg::FUID &classId, VST3HostContext &context);
    /// Takes component and controller apart and ends both, the controller first. Exceptions of the plug-in
    /// are logged and go no further.
    void close();

    /// Null while there is none. Both stay the instance's.
    Steinberg::Vst::IComponent *component() const { return m_component; }
    Steinberg::Vst::IEditController *controller() const { return m_controller; }
    bool hasOwnController() const { return m_hasOwnController; }

    /// The state of component and controller as one block; empty, with the reason in the log, when the
    /// component gives none.
    QByteArray state() const;
    /// Sets what `state` gave; false, with the reason in the log, when the block is damaged or the component
    /// refuses it.
    bool setState(const QByteArray &state);

private:
    bool startComponent(Steinberg::IPluginFactory *factory, const Steinberg::FUID &classId,
                        VST3HostContext &context);
    void findController(Steinberg::IPluginFactory *factory, VST3HostContext &context);
    void startOwnController(Steinberg::IPluginFactory *factory, VST3HostContext &context);
    void connect();
    void disconnect();
    void tellController(const QByteArray &componentState);

    Steinberg::Vst::IComponent *m_component = nullptr;
    Steinberg::Vst::IEditController *m_controller = nullptr;
    bool m_hasOwnController = false;
    Steinberg::IPtr<Steinberg::Vst::IConnectionPoint> m_componentPoint; ///< both set while connected
    Steinberg::IPtr<Steinberg::Vst::IConnectionPoint> m_controllerPoint;
};
