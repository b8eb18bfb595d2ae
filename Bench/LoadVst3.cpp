#include "Bench/LoadFloor.h"

#include "Main/AudioEngineController/Effects/VST3/VST3HostContext.h"

#include <pluginterfaces/base/ipluginbase.h>
#include <pluginterfaces/vst/ivstcomponent.h>

#include <cstring>
#include <set>
#include <string>

#include <dlfcn.h>

using namespace Steinberg;

namespace {

template <typename Interface, typename Call>
void withInterface(FUnknown *object, Call call)
{
    void *found = nullptr;
    if (object->queryInterface(Interface::iid, &found) != kResultOk)
        return;
    auto *known = static_cast<Interface *>(found);
    call(*known);
    known->release();
}

void askForBuses(Vst::IComponent &component)
{
    for (const Vst::BusDirection direction : {Vst::kInput, Vst::kOutput}) {
        const int32 count = component.getBusCount(Vst::kAudio, direction);
        for (int32 index = 0; index < count; ++index) {
            Vst::BusInfo bus = {};
            component.getBusInfo(Vst::kAudio, direction, index, bus);
        }
    }
}

bool instantiate(IPluginFactory *factory, const TUID classId, FUnknown *host)
{
    void *made = nullptr;
    if (factory->createInstance(classId, Vst::IComponent::iid, &made) != kResultOk)
        return false;
    auto *component = static_cast<Vst::IComponent *>(made);
    if (component->initialize(host) != kResultOk)
        return false;
    askForBuses(*component);
    component->terminate();
    component->release();
    return true;
}

int listClasses(IPluginFactory *factory, FUnknown *host)
{
    PFactoryInfo about;
    factory->getFactoryInfo(&about);
    std::set<std::string> names;
    int listed = 0;
    const int32 count = factory->countClasses();
    for (int32 index = 0; index < count; ++index) {
        PClassInfo info;
        factory->getClassInfo(index, &info);
        if (std::strcmp(info.category, "Audio Module Class") != 0 || !names.insert(info.name).second)
            continue;
        withInterface<IPluginFactory2>(factory, [&](IPluginFactory2 &factory2) {
            PClassInfo2 more;
            factory2.getClassInfo2(index, &more);
        });
        withInterface<IPluginFactory3>(factory, [&](IPluginFactory3 &factory3) {
            PClassInfoW unicode;
            factory3.getClassInfoUnicode(index, &unicode);
        });
        listed += instantiate(factory, info.cid, host) ? 1 : 0;
    }
    return listed;
}

int listModule(void *library)
{
    const auto getFactory = reinterpret_cast<IPluginFactory *(*)()>(dlsym(library, "GetPluginFactory"));
    IPluginFactory *const owned = getFactory ? getFactory() : nullptr;
    if (!owned)
        return 0;
    int listed = 0;
    const auto host = VST3HostContext::createOwned(nullptr);
    withInterface<IPluginFactory>(
        owned, [&](IPluginFactory &factory) { listed = listClasses(&factory, host->unknown()); });
    owned->release();
    return listed;
}

} // namespace

int loadVst3(const char *path)
{
    void *const library = dlopen(path, RTLD_NOW | RTLD_LOCAL);
    if (!library)
        return -1;
    const auto enter = reinterpret_cast<bool (*)(void *)>(dlsym(library, "ModuleEntry"));
    const int listed = !enter || enter(library) ? listModule(library) : 0;
    if (const auto leave = reinterpret_cast<bool (*)()>(dlsym(library, "ModuleExit")))
        leave();
    dlclose(library);
    return listed;
}
