#include "Tests/Fixtures/VST3/ScriptedComponent.h"

#include "Tests/Fixtures/FixtureMisuse.h"
#include "Tests/Fixtures/VST3/ScriptedModule.h"

#include <pluginterfaces/base/ibstream.h>
#include <pluginterfaces/vst/ivstcomponent.h>
#include <pluginterfaces/vst/ivsteditcontroller.h>
#include <pluginterfaces/vst/ivsthostapplication.h>
#include <pluginterfaces/vst/ivstmessage.h>

#include <memory>

using namespace Steinberg;

namespace {

const char *nameOf(Vst::BusDirection direction) { return direction == Vst::kInput ? "input" : "output"; }

/// All that a stream holds from where it stands.
std::string textOf(IBStream *stream)
{
    std::string text;
    char bytes[4096];
    int32 count = 0;
    while (stream && stream->read(bytes, sizeof bytes, &count) == kResultOk && count > 0)
        text.append(bytes, static_cast<std::size_t>(count));
    return text;
}

/// Whether the context is a host that says its name.
bool hasHostName(FUnknown *context)
{
    Vst::IHostApplication *application = nullptr;
    if (!context || context->queryInterface(Vst::IHostApplication::iid,
                                            reinterpret_cast<void **>(&application)) != kResultOk)
        return false;
    Vst::String128 name = {};
    const tresult result = application->getName(name);
    application->release();
    return result == kResultOk && name[0] != 0;
}

/// An instance of a scripted class: a component, an edit controller or both in one. The module owns it until
/// it is unloaded, so that a call to an instance that the host has released is reported rather than
/// undefined.
class ScriptedComponent final : public Vst::IComponent,
                                public Vst::IEditController,
                                public Vst::IConnectionPoint {
public:
    explicit ScriptedComponent(const ScriptedClass &described)
        : m_class(described)
        , m_data(described.state)
    {}
    virtual ~ScriptedComponent() = default;
    /// Gives up the reference that it was made with.
    void forgetMaker() { --m_references; }

    tresult PLUGIN_API queryInterface(const TUID interfaceId, void **object) override
    {
        expectAlive("queryInterface");
        *object = nullptr;
        if (FUnknownPrivate::iidEqual(interfaceId, FUnknown::iid) ||
            FUnknownPrivate::iidEqual(interfaceId, IPluginBase::iid) ||
            (FUnknownPrivate::iidEqual(interfaceId, Vst::IComponent::iid) && isComponent()))
            *object = static_cast<Vst::IComponent *>(this);
        else if (FUnknownPrivate::iidEqual(interfaceId, Vst::IEditController::iid) && isController())
            *object = static_cast<Vst::IEditController *>(this);
        else if (FUnknownPrivate::iidEqual(interfaceId, Vst::IConnectionPoint::iid))
            *object = static_cast<Vst::IConnectionPoint *>(this);
        else
            return kNoInterface;
        addRef();
        return kResultOk;
    }

    uint32 PLUGIN_API addRef() override
    {
        expectAlive("addRef");
        return ++m_references;
    }

    uint32 PLUGIN_API release() override
    {
        expectAlive("release");
        if (m_references > 1)
            return --m_references;
        if (m_state == State::Initialized)
            reportMisuse("'" + m_class.name + "' was released without terminate");
        m_references = 0;
        scriptedModule().stages.reach("release", m_class.name);
        return 0;
    }

    tresult PLUGIN_API initialize(FUnknown *context) override
    {
        expectAlive("initialize");
        if (m_state == State::Initialized)
            reportMisuse("'" + m_class.name + "' was initialised twice");
        scriptedModule().stages.reach("initialize", m_class.name);
        if (!hasHostName(context))
            reportMisuse("'" + m_class.name + "' was initialised by a host without a name");
        const tresult result = scriptedModule().result("initialize", m_class.name);
        m_state = result == kResultOk ? State::Initialized : State::Refused;
        return result;
    }

    tresult PLUGIN_API terminate() override
    {
        expectInitialized("terminate");
        m_state = State::Terminated;
        scriptedModule().stages.reach("terminate", m_class.name);
        return scriptedModule().result("terminate", m_class.name);
    }

    tresult PLUGIN_API getControllerClassId(TUID classId) override
    {
        const tresult result = reach("controller-class-id");
        if (result != kResultOk || m_class.controller.empty())
            return result == kResultOk ? kNotImplemented : result;
        if (const ScriptedClass *controller = scriptedModule().classWithName(m_class.controller))
            controller->id.toTUID(classId);
        return kResultOk;
    }

    tresult PLUGIN_API setIoMode(Vst::IoMode mode) override
    {
        expectAlive("setIoMode");
        scriptedModule().stages.reach("set-io-mode", m_class.name, std::to_string(mode));
        return scriptedModule().result("set-io-mode", m_class.name);
    }

    int32 PLUGIN_API getBusCount(Vst::MediaType type, Vst::BusDirection direction) override
    {
        expectInitialized("getBusCount");
        if (type != Vst::kAudio)
            return 0;
        scriptedModule().stages.reach("bus-count", m_class.name, nameOf(direction));
        const auto &stated = direction == Vst::kInput ? m_class.statedInputs : m_class.statedOutputs;
        const auto &buses = direction == Vst::kInput ? m_class.inputs : m_class.outputs;
        return stated ? *stated : static_cast<int32>(buses.size());
    }

    tresult PLUGIN_API getBusInfo(Vst::MediaType type, Vst::BusDirection direction, int32 index,
                                  Vst::BusInfo &bus) override
    {
        expectInitialized("getBusInfo");
        const auto &buses = direction == Vst::kInput ? m_class.inputs : m_class.outputs;
        // Not in the trace: a host that believes a huge count would fill the disk.
        if (type != Vst::kAudio || index < 0 || static_cast<std::size_t>(index) >= buses.size())
            return kInvalidArgument;
        scriptedModule().stages.reach("bus-info", m_class.name,
                                      std::string(nameOf(direction)) + " " + std::to_string(index));
        const tresult result = scriptedModule().result("bus-info", m_class.name);
        if (result != kResultOk)
            return result;
        const ScriptedBus &scripted = buses[static_cast<std::size_t>(index)];
        bus = {};
        bus.mediaType = type;
        bus.direction = direction;
        bus.channelCount = scripted.channels;
        bus.busType = scripted.type;
        return kResultOk;
    }

    tresult PLUGIN_API getRoutingInfo(Vst::RoutingInfo &, Vst::RoutingInfo &) override
    {
        return kNotImplemented;
    }

    tresult PLUGIN_API activateBus(Vst::MediaType, Vst::BusDirection, int32, TBool) override
    {
        return kResultOk;
    }

    tresult PLUGIN_API setActive(TBool) override { return kResultOk; }

    tresult PLUGIN_API setState(IBStream *state) override
    {
        const std::string bytes = textOf(state);
        const tresult result = reach("set-state", bytes);
        if (result == kResultOk)
            m_data = bytes;
        return result;
    }

    tresult PLUGIN_API getState(IBStream *state) override
    {
        const tresult result = reach("get-state");
        if (result != kResultOk || !m_data)
            return result == kResultOk ? kNotImplemented : result;
        std::string bytes = *m_data;
        return state->write(bytes.data(), static_cast<int32>(bytes.size()), nullptr);
    }

    tresult PLUGIN_API setComponentState(IBStream *state) override
    {
        return reach("set-component-state", textOf(state));
    }

    tresult PLUGIN_API setComponentHandler(Vst::IComponentHandler *handler) override
    {
        return reach("set-component-handler", handler ? "" : "null");
    }

    tresult PLUGIN_API connect(Vst::IConnectionPoint *) override { return reach("connect"); }

    tresult PLUGIN_API disconnect(Vst::IConnectionPoint *) override { return reach("disconnect"); }

    int32 PLUGIN_API getParameterCount() override { return 0; }
    tresult PLUGIN_API getParameterInfo(int32, Vst::ParameterInfo &) override { return kInvalidArgument; }
    tresult PLUGIN_API getParamStringByValue(Vst::ParamID, Vst::ParamValue, Vst::String128) override
    {
        return kInvalidArgument;
    }
    tresult PLUGIN_API getParamValueByString(Vst::ParamID, Vst::TChar *, Vst::ParamValue &) override
    {
        return kInvalidArgument;
    }
    Vst::ParamValue PLUGIN_API normalizedParamToPlain(Vst::ParamID, Vst::ParamValue) override { return 0; }
    Vst::ParamValue PLUGIN_API plainParamToNormalized(Vst::ParamID, Vst::ParamValue) override { return 0; }
    Vst::ParamValue PLUGIN_API getParamNormalized(Vst::ParamID) override { return 0; }
    tresult PLUGIN_API setParamNormalized(Vst::ParamID, Vst::ParamValue) override { return kInvalidArgument; }
    IPlugView *PLUGIN_API createView(FIDString) override { return nullptr; }
    tresult PLUGIN_API notify(Vst::IMessage *) override { return kResultOk; }

private:
    enum class State { Created, Initialized, Refused, Terminated };

    bool isController() const
    {
        return m_class.controller == "self" || m_class.category == "Component Controller Class";
    }

    bool isComponent() const { return !isController() || m_class.controller == "self"; }

    /// Announces a call to an initialised instance; the scripted answer.
    tresult reach(const char *stage, const std::string &detail = {})
    {
        expectInitialized(stage);
        scriptedModule().stages.reach(stage, m_class.name, detail);
        return scriptedModule().result(stage, m_class.name);
    }

    void expectAlive(const char *call) const
    {
        if (m_references == 0)
            reportMisuse(std::string(call) + " of '" + m_class.name + "' after its last release");
        if (m_state == State::Refused)
            reportMisuse(std::string(call) + " of '" + m_class.name + "' after initialize failed");
    }

    void expectInitialized(const char *call) const
    {
        expectAlive(call);
        if (m_state != State::Initialized)
            reportMisuse(std::string(call) + " of '" + m_class.name + "', which is not initialised");
    }

    const ScriptedClass &m_class;
    std::optional<std::string> m_data;
    State m_state = State::Created;
    uint32 m_references = 1;
};

} // namespace

tresult createComponent(const ScriptedClass &described, FIDString interfaceId, void **object)
{
    static std::vector<std::unique_ptr<ScriptedComponent>> all;
    all.push_back(std::make_unique<ScriptedComponent>(described));
    ScriptedComponent &made = *all.back();
    const tresult result = made.queryInterface(interfaceId, object);
    made.forgetMaker();
    return result;
}
