#pragma once

#include "Tests/Fixtures/VST3/ScriptedModule.h"

#include <pluginterfaces/vst/ivstcomponent.h>
#include <pluginterfaces/vst/ivsteditcontroller.h>
#include <pluginterfaces/vst/ivstmessage.h>

/// An instance of a scripted class: a component, an edit controller or both in one. The module owns it until
/// it is unloaded, so that a call to an instance that the host has released is reported rather than
/// undefined.
class ScriptedComponent final : public Steinberg::Vst::IComponent,
                                public Steinberg::Vst::IEditController,
                                public Steinberg::Vst::IConnectionPoint {
public:
    /// A new instance under an interface, with one reference; no object where the class lacks it.
    static Steinberg::tresult create(const ScriptedClass &described, Steinberg::FIDString interfaceId,
                                     void **object);

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

    Steinberg::tresult PLUGIN_API setComponentState(Steinberg::IBStream *state) override;
    Steinberg::tresult PLUGIN_API setComponentHandler(Steinberg::Vst::IComponentHandler *handler) override;
    Steinberg::int32 PLUGIN_API getParameterCount() override { return 0; }
    Steinberg::tresult PLUGIN_API getParameterInfo(Steinberg::int32, Steinberg::Vst::ParameterInfo &) override
    {
        return Steinberg::kInvalidArgument;
    }
    Steinberg::tresult PLUGIN_API getParamStringByValue(Steinberg::Vst::ParamID, Steinberg::Vst::ParamValue,
                                                        Steinberg::Vst::String128) override
    {
        return Steinberg::kInvalidArgument;
    }
    Steinberg::tresult PLUGIN_API getParamValueByString(Steinberg::Vst::ParamID, Steinberg::Vst::TChar *,
                                                        Steinberg::Vst::ParamValue &) override
    {
        return Steinberg::kInvalidArgument;
    }
    Steinberg::Vst::ParamValue PLUGIN_API normalizedParamToPlain(Steinberg::Vst::ParamID,
                                                                 Steinberg::Vst::ParamValue value) override
    {
        return value;
    }
    Steinberg::Vst::ParamValue PLUGIN_API plainParamToNormalized(Steinberg::Vst::ParamID,
                                                                 Steinberg::Vst::ParamValue value) override
    {
        return value;
    }
    Steinberg::Vst::ParamValue PLUGIN_API getParamNormalized(Steinberg::Vst::ParamID) override { return 0; }
    Steinberg::tresult PLUGIN_API setParamNormalized(Steinberg::Vst::ParamID,
                                                     Steinberg::Vst::ParamValue) override
    {
        return Steinberg::kInvalidArgument;
    }
    Steinberg::IPlugView *PLUGIN_API createView(Steinberg::FIDString) override { return nullptr; }

    Steinberg::tresult PLUGIN_API connect(Steinberg::Vst::IConnectionPoint *other) override;
    Steinberg::tresult PLUGIN_API disconnect(Steinberg::Vst::IConnectionPoint *other) override;
    Steinberg::tresult PLUGIN_API notify(Steinberg::Vst::IMessage *) override { return Steinberg::kResultOk; }

    explicit ScriptedComponent(const ScriptedClass &described);
    virtual ~ScriptedComponent() = default;

private:
    enum class State { Created, Initialized, Refused, Terminated };

    void expectAlive(const char *call) const;
    void expectInitialized(const char *call) const;

    bool isController() const;
    bool isComponent() const { return !isController() || m_class.controller == "self"; }
    /// Announces a call to an initialised instance; the scripted answer.
    Steinberg::tresult reach(const char *stage, const std::string &detail = {});

    const ScriptedClass &m_class;
    std::optional<std::string> m_data;
    State m_state = State::Created;
    Steinberg::uint32 m_references = 1;
};
