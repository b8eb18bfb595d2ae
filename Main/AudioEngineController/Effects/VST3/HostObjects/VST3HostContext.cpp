#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostContext.h"

#include "Main/AudioEngineController/Effects/VST3/HostObjects/IVST3EditOwner.h"
#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostMessage.h"

#include <algorithm>
#include <iterator>

using namespace Steinberg;

namespace {

constexpr char kHostName[] = "Quillon";
static_assert(sizeof(kHostName) <= 128, "a plug-in's buffer for names has 128 units");

// The reference that the object starts with is swapped for the one that the search adds, so that an object
// without the interface asked for goes away again.
template <typename Object>
tresult createAs(const int8 *interfaceId, void **obj) noexcept
{
    Object *object = Object::createCounted();
    if (object == nullptr)
        return kOutOfMemory;
    const tresult result = object->queryInterface(interfaceId, obj);
    object->release();
    return result == kResultOk ? result : kNoInterface;
}

} // namespace

VST3HostContext::VST3HostContext(VST3Holder holder, IVST3EditOwner *owner)
    : VST3HostObject(holder)
    , m_owner(owner)
    , m_attributes(VST3HostAttributeList::createOwned())
{}

tresult PLUGIN_API VST3HostContext::queryInterface(const TUID interfaceId, void **obj)
{
    if (obj == nullptr || !isInterface(interfaceId, Vst::IAttributeList::iid))
        return VST3HostObject::queryInterface(interfaceId, obj);
    *obj = static_cast<Vst::IAttributeList *>(m_attributes.get());
    return kResultOk;
}

void VST3HostContext::letGo() noexcept
{
    m_owner = nullptr;
    VST3HostObject::letGo();
}

template <typename... Parameters>
tresult VST3HostContext::forward(tresult (IVST3EditOwner::*operation)(Parameters...) noexcept,
                                 Parameters... arguments) noexcept
{
    IVST3EditOwner *owner = m_owner;
    return owner != nullptr ? (owner->*operation)(arguments...) : kResultFalse;
}

tresult PLUGIN_API VST3HostContext::beginEdit(Vst::ParamID id)
{
    return forward(&IVST3EditOwner::editGesture, id, true);
}

tresult PLUGIN_API VST3HostContext::performEdit(Vst::ParamID id, Vst::ParamValue value)
{
    return forward(&IVST3EditOwner::performEdit, id, value);
}

tresult PLUGIN_API VST3HostContext::endEdit(Vst::ParamID id)
{
    return forward(&IVST3EditOwner::editGesture, id, false);
}

tresult PLUGIN_API VST3HostContext::restartComponent(int32 flags)
{
    return forward(&IVST3EditOwner::restartComponent, flags);
}

tresult PLUGIN_API VST3HostContext::setDirty(TBool state)
{
    return forward(&IVST3EditOwner::setDirty, state);
}

tresult PLUGIN_API VST3HostContext::requestOpenEditor(FIDString name)
{
    return forward(&IVST3EditOwner::requestOpenEditor, name);
}

tresult PLUGIN_API VST3HostContext::startGroupEdit() { return forward(&IVST3EditOwner::groupEdit, true); }

tresult PLUGIN_API VST3HostContext::finishGroupEdit() { return forward(&IVST3EditOwner::groupEdit, false); }

Vst::IContextMenu *PLUGIN_API VST3HostContext::createContextMenu(IPlugView *view, const Vst::ParamID *id)
{
    IVST3EditOwner *owner = m_owner;
    return owner != nullptr ? owner->createContextMenu(view, id) : nullptr;
}

tresult PLUGIN_API VST3HostContext::executeMenuItem(int32 tag)
{
    return forward(&IVST3EditOwner::executeMenuItem, tag);
}

tresult PLUGIN_API VST3HostContext::getName(Vst::String128 name)
{
    if (name == nullptr)
        return kInvalidArgument;
    std::copy(std::begin(kHostName), std::end(kHostName), name);
    return kResultOk;
}

tresult PLUGIN_API VST3HostContext::createInstance(TUID classId, TUID interfaceId, void **obj)
{
    if (obj == nullptr)
        return kInvalidArgument;
    *obj = nullptr;
    if (isInterface(classId, Vst::IMessage::iid))
        return createAs<VST3HostMessage>(interfaceId, obj);
    if (isInterface(classId, Vst::IAttributeList::iid))
        return createAs<VST3HostAttributeList>(interfaceId, obj);
    return kNoInterface;
}

tresult PLUGIN_API VST3HostContext::notifyUnitSelection(Vst::UnitID unit)
{
    return forward(&IVST3EditOwner::notifyUnitSelection, unit);
}

tresult PLUGIN_API VST3HostContext::notifyProgramListChange(Vst::ProgramListID list, int32 programIndex)
{
    return forward(&IVST3EditOwner::notifyProgramListChange, list, programIndex);
}

tresult PLUGIN_API VST3HostContext::requestBusActivation(Vst::MediaType type, Vst::BusDirection direction,
                                                         int32 index, TBool state)
{
    return forward(&IVST3EditOwner::requestBusActivation, type, direction, index, state);
}
