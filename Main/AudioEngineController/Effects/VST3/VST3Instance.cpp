#include "Main/AudioEngineController/Effects/VST3/VST3Instance.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Query.h"
#include "Main/AudioEngineController/Effects/VST3/VST3State.h"

using namespace Steinberg;

namespace {

/// Takes one step of closing; the ones after it are taken whatever it throws.
template <typename Step>
void closeStep(Step step)
{
    if (const QString thrown = thrownBy(step); !thrown.isEmpty())
        DebugLog(L"While the instance was being closed, %ls", thrown);
}

} // namespace

VST3Instance::~VST3Instance() { close(); }

bool VST3Instance::create(IPluginFactory *factory, const FUID &classId, VST3HostContext &context)
{
    const FUnknownPtr<IPluginFactory3> newest(factory);
    if (newest)
        newest->setHostContext(context.unknown());
    IPluginFactory *const maker = newest ? newest.get() : factory;
    if (!startComponent(maker, classId, context))
        return false;
    findController(maker, context);
    return true;
}

bool VST3Instance::startComponent(IPluginFactory *factory, const FUID &classId, VST3HostContext &context)
{
    QString reason;
    auto *const component = createObject<Vst::IComponent>(factory, classId, reason);
    if (component)
        component->setIoMode(Vst::kAdvanced);
    if (!component || !initialise(*component, context.unknown(), reason)) {
        DebugLog(L"The component %ls", reason);
        return false;
    }
    m_component = component;
    return true;
}

void VST3Instance::findController(IPluginFactory *factory, VST3HostContext &context)
{
    m_controller = FUnknownPtr<Vst::IEditController>(m_component).take();
    if (!m_controller)
        startOwnController(factory, context);
    if (!m_controller)
        return;
    m_controller->setComponentHandler(&context);
    if (!m_hasOwnController)
        return;
    connect();
    tellController(stateOf(*m_component));
}

void VST3Instance::startOwnController(IPluginFactory *factory, VST3HostContext &context)
{
    TUID classId = {};
    if (m_component->getControllerClassId(classId) != kResultOk)
        return; // a plug-in without parameters needs none
    QString reason;
    auto *const controller = createObject<Vst::IEditController>(factory, FUID::fromTUID(classId), reason);
    if (!controller || !initialise(*controller, context.unknown(), reason)) {
        DebugLog(L"The edit controller %ls", reason);
        return;
    }
    m_controller = controller;
    m_hasOwnController = true;
}

void VST3Instance::connect()
{
    m_componentPoint = FUnknownPtr<Vst::IConnectionPoint>(m_component);
    m_controllerPoint = FUnknownPtr<Vst::IConnectionPoint>(m_controller);
    if (!m_componentPoint || !m_controllerPoint)
        return;
    m_componentPoint->connect(m_controllerPoint);
    m_controllerPoint->connect(m_componentPoint);
}

void VST3Instance::disconnect()
{
    if (m_componentPoint && m_controllerPoint) {
        closeStep([this] { m_componentPoint->disconnect(m_controllerPoint); });
        closeStep([this] { m_controllerPoint->disconnect(m_componentPoint); });
    }
    for (Vst::IConnectionPoint *point : {m_componentPoint.take(), m_controllerPoint.take()})
        if (point)
            closeStep([point] { point->release(); });
}

void VST3Instance::close()
{
    disconnect();
    if (m_controller) {
        closeStep([this] { m_controller->setComponentHandler(nullptr); });
        if (m_hasOwnController)
            closeStep([this] { m_controller->terminate(); });
        closeStep([this] { m_controller->release(); });
    }
    m_controller = nullptr;
    m_hasOwnController = false;
    if (m_component) {
        closeStep([this] { m_component->terminate(); });
        closeStep([this] { m_component->release(); });
    }
    m_component = nullptr;
}

QByteArray VST3Instance::state() const
{
    if (!m_component)
        return QByteArray();
    const QByteArray component = stateOf(*m_component);
    if (component.isNull()) {
        DebugLog(L"The component gives no state");
        return QByteArray();
    }
    return writeVST3State({component, m_controller ? stateOf(*m_controller) : QByteArray()});
}

bool VST3Instance::setState(const QByteArray &state)
{
    QString reason;
    const std::optional<VST3State> parts = readVST3State(state, reason);
    if (!m_component || !parts) {
        DebugLog(L"The state cannot be set: %ls", reason);
        return false;
    }
    const tresult result =
        parts->component.isEmpty() ? kResultOk : setStateOf(*m_component, parts->component);
    // NOTE: DPF answers with an error where a plug-in has neither parameters nor states, having written one
    // byte itself. What counts is the state that it has then.
    if (result != kResultOk && stateOf(*m_component) != parts->component) {
        DebugLog(L"The component refuses the state: 0x%08X", result);
        return false;
    }
    tellController(parts->component);
    if (m_controller && !parts->controller.isEmpty())
        setStateOf(*m_controller, parts->controller); // what it shows only; many have none
    return true;
}

/// The controller follows the component, of which it knows nothing else.
void VST3Instance::tellController(const QByteArray &componentState)
{
    if (!m_controller || componentState.isEmpty())
        return;
    const IPtr<IBStream> stream = streamOf(componentState);
    m_controller->setComponentState(stream);
}
