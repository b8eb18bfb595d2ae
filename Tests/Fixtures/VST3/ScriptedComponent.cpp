#include "Tests/Fixtures/VST3/VST3Script.h"

#include <pluginterfaces/base/ibstream.h>
#include <pluginterfaces/vst/ivstcomponent.h>
#include <pluginterfaces/vst/ivsteditcontroller.h>
#include <pluginterfaces/vst/ivsthostapplication.h>
#include <pluginterfaces/vst/ivstmessage.h>

#include <algorithm>
#include <memory>
#include <optional>

using namespace Steinberg;

namespace {

const char kController[] = "Component Controller Class";

/// The buses of a direction, each "CHANNELS" or "CHANNELS:TYPE".
FixtureScript::Words busesOf(const FixtureSubject &described, Vst::BusDirection direction)
{
    const auto stated = script().all(direction == Vst::kInput ? "inputs" : "outputs", described.place);
    return stated.empty() ? FixtureScript::Words{"2"} : stated.back();
}

const char *nameOf(Vst::BusDirection direction) { return direction == Vst::kInput ? "input" : "output"; }

/// All that a stream holds from where it stands.
std::string contentOf(IBStream *stream)
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
    const FUnknownPtr<Vst::IHostApplication> application(context);
    Vst::String128 name = {};
    return application && application->getName(name) == kResultOk && name[0] != 0;
}

/// An instance of a scripted class: a component, an edit controller or both in one. The module owns it until
/// it is unloaded, so that a call to an instance that the host has released is reported rather than
/// undefined.
class ScriptedComponent final : public Vst::IComponent,
                                public Vst::IEditController,
                                public Vst::IConnectionPoint {
public:
    explicit ScriptedComponent(const FixtureSubject &described)
        : m_class(described)
        , m_isController(textOf(described, "controller") == "self" ||
                         textOf(described, "category") == kController)
        , m_isComponent(textOf(described, "category") != kController)
    {
        if (script().has("state", described.place))
            m_data = textOf(described, "state");
    }
    virtual ~ScriptedComponent() = default;
    /// Gives up the reference that it was made with.
    void forgetMaker() { --m_references; }

    tresult PLUGIN_API queryInterface(const TUID id, void **object) override
    {
        expectAlive("queryInterface");
        *object = nullptr;
        if (m_isComponent) {
            QUERY_INTERFACE(id, object, Vst::IComponent::iid, Vst::IComponent)
        }
        if (m_isController) {
            QUERY_INTERFACE(id, object, Vst::IEditController::iid, Vst::IEditController)
        }
        QUERY_INTERFACE(id, object, FUnknown::iid, Vst::IComponent)
        QUERY_INTERFACE(id, object, Vst::IConnectionPoint::iid, Vst::IConnectionPoint)
        return kNoInterface;
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
        script().reach("release", m_class);
        return 0;
    }

    tresult PLUGIN_API initialize(FUnknown *context) override
    {
        expectAlive("initialize");
        if (m_state == State::Initialized)
            reportMisuse("'" + m_class.name + "' was initialised twice");
        script().reach("initialize", m_class);
        if (!hasHostName(context))
            reportMisuse("'" + m_class.name + "' was initialised by a host without a name");
        const tresult result = resultAt("initialize", m_class);
        m_state = result == kResultOk ? State::Initialized : State::Refused;
        return result;
    }

    tresult PLUGIN_API terminate() override
    {
        expectInitialized("terminate");
        m_state = State::Terminated;
        script().reach("terminate", m_class);
        return resultAt("terminate", m_class);
    }

    tresult PLUGIN_API getControllerClassId(TUID classId) override
    {
        const tresult result = reach("controller-class-id");
        const std::string name = textOf(m_class, "controller");
        if (result != kResultOk || name.empty())
            return result == kResultOk ? kNotImplemented : result;
        for (const FixtureSubject &other : script().subjects)
            if (other.name == name && other.place > 0)
                idOf(other).toTUID(classId);
        return kResultOk;
    }

    tresult PLUGIN_API setIoMode(Vst::IoMode mode) override
    {
        expectAlive("setIoMode");
        script().reach("set-io-mode", m_class, std::to_string(mode));
        return resultAt("set-io-mode", m_class);
    }

    int32 PLUGIN_API getBusCount(Vst::MediaType type, Vst::BusDirection direction) override
    {
        expectInitialized("getBusCount");
        if (type != Vst::kAudio)
            return 0;
        script().reach("bus-count", m_class, nameOf(direction));
        return script().number(direction == Vst::kInput ? "stated-inputs" : "stated-outputs", m_class.place,
                               static_cast<int32>(busesOf(m_class, direction).size()));
    }

    tresult PLUGIN_API getBusInfo(Vst::MediaType type, Vst::BusDirection direction, int32 index,
                                  Vst::BusInfo &bus) override
    {
        expectInitialized("getBusInfo");
        const FixtureScript::Words buses = busesOf(m_class, direction);
        // Not in the trace: a host that believes a huge count would fill the disk.
        if (type != Vst::kAudio || index < 0 || static_cast<std::size_t>(index) >= buses.size())
            return kInvalidArgument;
        script().reach("bus-info", m_class, std::string(nameOf(direction)) + " " + std::to_string(index));
        const tresult result = resultAt("bus-info", m_class);
        if (result != kResultOk)
            return result;
        const std::string &word = buses[static_cast<std::size_t>(index)];
        const std::size_t colon = std::min(word.find(':'), word.size());
        const std::string busType = word.substr(std::min(colon + 1, word.size()));
        bus = {};
        bus.mediaType = type;
        bus.direction = direction;
        bus.channelCount = numberOf(word.substr(0, colon));
        bus.busType = busType.empty() ? 0 : busType == "aux" ? 1 : numberOf(busType);
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
        const std::string bytes = contentOf(state);
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
        return state->write(m_data->data(), static_cast<int32>(m_data->size()), nullptr);
    }

    tresult PLUGIN_API setComponentState(IBStream *state) override
    {
        return reach("set-component-state", contentOf(state));
    }
    tresult PLUGIN_API setComponentHandler(Vst::IComponentHandler *handler) override
    {
        return reach("set-component-handler", handler ? "" : "null");
    }
    tresult PLUGIN_API connect(Vst::IConnectionPoint *) override { return reach("connect"); }
    tresult PLUGIN_API disconnect(Vst::IConnectionPoint *) override { return reach("disconnect"); }

    int32 PLUGIN_API getParameterCount() override { return 0; }
    tresult PLUGIN_API getParameterInfo(int32, Vst::ParameterInfo &) override { return kInvalidArgument; }
    tresult PLUGIN_API getParamStringByValue(Vst::ParamID, double, Vst::String128) override
    {
        return kResultFalse;
    }
    tresult PLUGIN_API getParamValueByString(Vst::ParamID, char16 *, double &) override
    {
        return kResultFalse;
    }
    double PLUGIN_API normalizedParamToPlain(Vst::ParamID, double) override { return 0; }
    double PLUGIN_API plainParamToNormalized(Vst::ParamID, double) override { return 0; }
    double PLUGIN_API getParamNormalized(Vst::ParamID) override { return 0; }
    tresult PLUGIN_API setParamNormalized(Vst::ParamID, double) override { return kInvalidArgument; }
    IPlugView *PLUGIN_API createView(FIDString) override { return nullptr; }
    tresult PLUGIN_API notify(Vst::IMessage *) override { return kResultOk; }

private:
    enum class State { Created, Initialized, Refused, Terminated };

    /// Announces a call to an initialised instance; the scripted answer.
    tresult reach(const char *stage, const std::string &detail = {})
    {
        expectInitialized(stage);
        script().reach(stage, m_class, detail);
        return resultAt(stage, m_class);
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

    FixtureSubject m_class;
    bool m_isController, m_isComponent;
    std::optional<std::string> m_data;
    State m_state = State::Created;
    uint32 m_references = 1;
};

} // namespace

tresult createInstanceOf(const FixtureSubject &described, FIDString interfaceId, void **object)
{
    static std::vector<std::unique_ptr<ScriptedComponent>> all;
    all.push_back(std::make_unique<ScriptedComponent>(described));
    const tresult result = all.back()->queryInterface(interfaceId, object);
    all.back()->forgetMaker();
    return result;
}
