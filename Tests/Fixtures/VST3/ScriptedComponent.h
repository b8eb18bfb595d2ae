#pragma once

#include "Tests/Fixtures/VST3/ScriptedModule.h"

#include <pluginterfaces/vst/ivstcomponent.h>

/// An instance of a scripted class. The module owns it until it is unloaded, so that a call to an instance
/// that the host has released is reported rather than undefined.
class ScriptedComponent final : public Steinberg::Vst::IComponent {
public:
    /// A new instance with one reference.
    static ScriptedComponent *create(const ScriptedClass &described);

    Steinberg::tresult PLUGIN_API queryInterface(const Steinberg::TUID interfaceId, void **object) override;
    Steinberg::uint32 PLUGIN_API addRef() override;
    Steinberg::uint32 PLUGIN_API release() override;

    Steinberg::tresult PLUGIN_API initialize(Steinberg::FUnknown *context) override;
    Steinberg::tresult PLUGIN_API terminate() override;

    Steinberg::tresult PLUGIN_API getControllerClassId(Steinberg::TUID classId) override;
    Steinberg::tresult PLUGIN_API setIoMode(Steinberg::Vst::IoMode mode) override;
    Steinberg::int32 PLUGIN_API getBusCount(Steinberg::Vst::MediaType type,
                                            Steinberg::Vst::BusDirection direction) override;
    Steinberg::tresult PLUGIN_API getBusInfo(Steinberg::Vst::MediaType type,
                                             Steinberg::Vst::BusDirection direction, Steinberg::int32 index,
                                             Steinberg::Vst::BusInfo &bus) override;
    Steinberg::tresult PLUGIN_API getRoutingInfo(Steinberg::Vst::RoutingInfo &in,
                                                 Steinberg::Vst::RoutingInfo &out) override;
    Steinberg::tresult PLUGIN_API activateBus(Steinberg::Vst::MediaType type,
                                              Steinberg::Vst::BusDirection direction, Steinberg::int32 index,
                                              Steinberg::TBool state) override;
    Steinberg::tresult PLUGIN_API setActive(Steinberg::TBool state) override;
    Steinberg::tresult PLUGIN_API setState(Steinberg::IBStream *state) override;
    Steinberg::tresult PLUGIN_API getState(Steinberg::IBStream *state) override;

    explicit ScriptedComponent(const ScriptedClass &described);
    virtual ~ScriptedComponent() = default;

private:
    enum class State { Created, Initialized, Refused, Terminated };

    void expectAlive(const char *call) const;
    void expectInitialized(const char *call) const;

    const ScriptedClass &m_class;
    State m_state = State::Created;
    Steinberg::uint32 m_references = 1;
};
