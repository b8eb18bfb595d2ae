#include "Tests/Fixtures/VST3/ScriptedComponent.h"

#include "Tests/Fixtures/FixtureMisuse.h"
#include "Tests/Fixtures/VST3/HostQuestions.h"

#include <memory>

using namespace Steinberg;

namespace {

std::vector<std::unique_ptr<ScriptedComponent>> &components()
{
    static std::vector<std::unique_ptr<ScriptedComponent>> all;
    return all;
}

const char *nameOf(Vst::BusDirection direction) { return direction == Vst::kInput ? "input" : "output"; }

} // namespace

ScriptedComponent *ScriptedComponent::create(const ScriptedClass &described)
{
    components().push_back(std::make_unique<ScriptedComponent>(described));
    return components().back().get();
}

ScriptedComponent::ScriptedComponent(const ScriptedClass &described)
    : m_class(described)
{}

tresult ScriptedComponent::queryInterface(const TUID interfaceId, void **object)
{
    expectAlive("queryInterface");
    *object = nullptr;
    if (!FUnknownPrivate::iidEqual(interfaceId, FUnknown::iid) &&
        !FUnknownPrivate::iidEqual(interfaceId, IPluginBase::iid) &&
        !FUnknownPrivate::iidEqual(interfaceId, Vst::IComponent::iid))
        return kNoInterface;
    *object = static_cast<Vst::IComponent *>(this);
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
    for (const std::string &question : m_class.questions)
        scriptedModule().stages.note("host-" + question, m_class.name, askHost(question, context));
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

tresult ScriptedComponent::getControllerClassId(TUID)
{
    expectAlive("getControllerClassId");
    return kNotImplemented;
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

tresult ScriptedComponent::setState(IBStream *) { return kNotImplemented; }

tresult ScriptedComponent::getState(IBStream *) { return kNotImplemented; }

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
