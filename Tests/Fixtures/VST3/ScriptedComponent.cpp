#include "Tests/Fixtures/VST3/ScriptedComponent.h"

#include "Tests/Fixtures/FixtureMisuse.h"
#include "Tests/Fixtures/VST3/HostName.h"

#include <pluginterfaces/base/ibstream.h>

#include <memory>

using namespace Steinberg;

namespace {

std::vector<std::unique_ptr<ScriptedComponent>> &components()
{
    static std::vector<std::unique_ptr<ScriptedComponent>> all;
    return all;
}

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

} // namespace

tresult ScriptedComponent::create(const ScriptedClass &described, FIDString interfaceId, void **object)
{
    components().push_back(std::make_unique<ScriptedComponent>(described));
    ScriptedComponent &made = *components().back();
    const tresult result = made.queryInterface(interfaceId, object);
    --made.m_references; // the one that it was made with
    return result;
}

ScriptedComponent::ScriptedComponent(const ScriptedClass &described)
    : m_class(described)
    , m_data(described.state)
{}

bool ScriptedComponent::isController() const
{
    return m_class.controller == "self" || m_class.category == "Component Controller Class";
}

tresult ScriptedComponent::queryInterface(const TUID interfaceId, void **object)
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

uint32 ScriptedComponent::addRef()
{
    expectAlive("addRef");
    return ++m_references;
}

uint32 ScriptedComponent::release()
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

tresult ScriptedComponent::initialize(FUnknown *context)
{
    expectAlive("initialize");
    if (m_state == State::Initialized)
        reportMisuse("'" + m_class.name + "' was initialised twice");
    scriptedModule().stages.reach("initialize", m_class.name);
    if (m_class.asksHostName)
        scriptedModule().stages.note("host-name", m_class.name, hostName(context));
    const tresult result = scriptedModule().result("initialize", m_class.name);
    m_state = result == kResultOk ? State::Initialized : State::Refused;
    return result;
}

tresult ScriptedComponent::terminate()
{
    expectInitialized("terminate");
    m_state = State::Terminated;
    scriptedModule().stages.reach("terminate", m_class.name);
    return scriptedModule().result("terminate", m_class.name);
}

tresult ScriptedComponent::getControllerClassId(TUID classId)
{
    const tresult result = reach("controller-class-id");
    if (result != kResultOk || m_class.controller.empty())
        return result == kResultOk ? kNotImplemented : result;
    if (const ScriptedClass *controller = scriptedModule().classWithName(m_class.controller))
        controller->id.toTUID(classId);
    return kResultOk;
}

tresult ScriptedComponent::setIoMode(Vst::IoMode mode)
{
    expectAlive("setIoMode");
    scriptedModule().stages.reach("set-io-mode", m_class.name, std::to_string(mode));
    return scriptedModule().result("set-io-mode", m_class.name);
}

int32 ScriptedComponent::getBusCount(Vst::MediaType type, Vst::BusDirection direction)
{
    expectInitialized("getBusCount");
    if (type != Vst::kAudio)
        return 0;
    scriptedModule().stages.reach("bus-count", m_class.name, nameOf(direction));
    const auto &stated = direction == Vst::kInput ? m_class.statedInputs : m_class.statedOutputs;
    const auto &buses = direction == Vst::kInput ? m_class.inputs : m_class.outputs;
    return stated ? *stated : static_cast<int32>(buses.size());
}

tresult ScriptedComponent::getBusInfo(Vst::MediaType type, Vst::BusDirection direction, int32 index,
                                      Vst::BusInfo &bus)
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

tresult ScriptedComponent::getRoutingInfo(Vst::RoutingInfo &, Vst::RoutingInfo &) { return kNotImplemented; }

tresult ScriptedComponent::activateBus(Vst::MediaType, Vst::BusDirection, int32, TBool) { return kResultOk; }

tresult ScriptedComponent::setActive(TBool) { return kResultOk; }

tresult ScriptedComponent::setState(IBStream *state)
{
    const std::string bytes = textOf(state);
    const tresult result = reach("set-state", bytes);
    if (result == kResultOk)
        m_data = bytes;
    return result;
}

tresult ScriptedComponent::getState(IBStream *state)
{
    const tresult result = reach("get-state");
    if (result != kResultOk || !m_data)
        return result == kResultOk ? kNotImplemented : result;
    std::string bytes = *m_data;
    return state->write(bytes.data(), static_cast<int32>(bytes.size()), nullptr);
}

tresult ScriptedComponent::setComponentState(IBStream *state)
{
    return reach("set-component-state", textOf(state));
}

tresult ScriptedComponent::setComponentHandler(Vst::IComponentHandler *handler)
{
    return reach("set-component-handler", handler ? "" : "null");
}

tresult ScriptedComponent::connect(Vst::IConnectionPoint *) { return reach("connect"); }

tresult ScriptedComponent::disconnect(Vst::IConnectionPoint *) { return reach("disconnect"); }

tresult ScriptedComponent::reach(const char *stage, const std::string &detail)
{
    expectInitialized(stage);
    scriptedModule().stages.reach(stage, m_class.name, detail);
    return scriptedModule().result(stage, m_class.name);
}

void ScriptedComponent::expectAlive(const char *call) const
{
    if (m_references == 0)
        reportMisuse(std::string(call) + " of '" + m_class.name + "' after its last release");
    if (m_state == State::Refused)
        reportMisuse(std::string(call) + " of '" + m_class.name + "' after initialize failed");
}

void ScriptedComponent::expectInitialized(const char *call) const
{
    expectAlive(call);
    if (m_state != State::Initialized)
        reportMisuse(std::string(call) + " of '" + m_class.name + "', which is not initialised");
}
