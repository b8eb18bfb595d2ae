// The least that a scan of these files can cost: each is loaded, the calls that a scan makes are made into
// it, and it is unloaded. Nothing is checked, and a plug-in that misbehaves takes the process along.

#include "Main/AudioEngineController/Effects/VST/Interface/VSTInterface.h"
#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostContext.h"

#include <pluginterfaces/base/ipluginbase.h>
#include <pluginterfaces/vst/ivstcomponent.h>

#include <cstdio>
#include <cstring>
#include <fstream>
#include <map>
#include <set>
#include <string>
#include <vector>

#include <dlfcn.h>

using namespace Steinberg;

namespace {

/// Room for texts, as much as the scan gives.
constexpr std::size_t kTextRoom = 1024 + 4096;

using HostCallback = VstIntPtr(AEffect *, VstInt32, VstInt32, VstIntPtr, void *, float);
using EntryPoint = AEffect *(*)(HostCallback *);

VstInt32 shellId = 0; ///< of the sub-plug-in whose entry point is being called

VstIntPtr answerPlugin(AEffect *, VstInt32 opcode, VstInt32, VstIntPtr, void *, float)
{
    static const std::map<int, VstIntPtr> answers = {{audioMasterVersion, 2400},
                                                     {audioMasterGetSampleRate, 44100},
                                                     {audioMasterGetBlockSize, 256},
                                                     {audioMasterWantMidi, 1},
                                                     {audioMasterGetVendorVersion, 1}};
    const auto answer = answers.find(opcode);
    return opcode == audioMasterCurrentId ? shellId : answer == answers.end() ? 0 : answer->second;
}

VstIntPtr dispatch(AEffect &effect, VstInt32 opcode, void *text = nullptr)
{
    return effect.dispatcher(&effect, opcode, 0, 0, text, 0.0f);
}

/// What is asked of a plug-in when it has been entered; gives its category.
VstIntPtr ask(AEffect &effect, char *text)
{
    const bool hasInputs = effect.numInputs != 0;
    const bool isSynth = !hasInputs || dispatch(effect, effGetPlugCategory) == kPlugCategSynth;
    if (shellId != 0 || !isSynth)
        dispatch(effect, effGetEffectName, text);
    const VstIntPtr category = hasInputs ? dispatch(effect, effGetPlugCategory) : VstIntPtr(kPlugCategSynth);
    dispatch(effect, effGetVendorString, text);
    return category;
}

std::vector<VstInt32> shellIds(AEffect &shell, char *text)
{
    std::vector<VstInt32> ids;
    while (const VstIntPtr id = dispatch(shell, effShellGetNextPlugin, text))
        ids.push_back(static_cast<VstInt32>(id));
    return ids;
}

int list(EntryPoint enter)
{
    std::vector<char> text(kTextRoom);
    AEffect *const effect = enter(answerPlugin);
    if (!effect)
        return 0;
    std::vector<AEffect *> entered = {effect};
    if (ask(*effect, text.data()) == kPlugCategShell)
        for (const VstInt32 id : shellIds(*effect, text.data())) {
            shellId = id;
            entered.push_back(enter(answerPlugin));
            ask(*entered.back(), text.data());
        }
    shellId = 0;
    for (auto each = entered.rbegin(); each != entered.rend(); ++each)
        dispatch(**each, effClose);
    return static_cast<int>(entered.size());
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
        PClassInfo2 more;
        if (const FUnknownPtr<IPluginFactory2> factory2{factory})
            factory2->getClassInfo2(index, &more);
        PClassInfoW unicode;
        if (const FUnknownPtr<IPluginFactory3> factory3{factory})
            factory3->getClassInfoUnicode(index, &unicode);
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
    const auto host = VST3HostContext::createOwned(nullptr);
    const int listed = listClasses(owned, host->unknown());
    owned->release();
    return listed;
}

/// Loads a module and has it listed. Gives the number of plug-ins in it, -1 when it could not be loaded.
int load(const char *path, int (*listIt)(void *library))
{
    void *const library = dlopen(path, RTLD_NOW | RTLD_LOCAL);
    const int listed = library ? listIt(library) : -1;
    if (library)
        dlclose(library);
    return listed;
}

int listVst2(void *library)
{
    void *entry = dlsym(library, "VSTPluginMain");
    if (!entry)
        entry = dlsym(library, "main");
    return entry ? list(reinterpret_cast<EntryPoint>(entry)) : 0;
}

int listVst3(void *library)
{
    const auto enter = reinterpret_cast<bool (*)(void *)>(dlsym(library, "ModuleEntry"));
    const int listed = !enter || enter(library) ? listModule(library) : 0;
    if (const auto leave = reinterpret_cast<bool (*)()>(dlsym(library, "ModuleExit")))
        leave();
    return listed;
}

/// The most memory that this process has held, in KiB. Not asked of getrusage, which counts what the process
/// that started this one held.
long peakMemory()
{
    std::ifstream status("/proc/self/status");
    long kibibytes = 0;
    for (std::string line; std::getline(status, line);)
        std::sscanf(line.c_str(), "VmHWM: %ld kB", &kibibytes); // NOLINT(cert-err34-c): the kernel's own form
    return kibibytes;
}

} // namespace

int main(int argc, char **argv)
{
    auto *listIt = listVst3;
    int listed = 0;
    for (int index = 1; index < argc; ++index) {
        const bool isVst2 = std::strcmp(argv[index], "vst2") == 0;
        if (isVst2 || std::strcmp(argv[index], "vst3") == 0) { // the files from here on
            listIt = isVst2 ? listVst2 : listVst3;
            continue;
        }
        const int plugins = load(argv[index], listIt);
        if (plugins < 0) {
            std::fprintf(stderr, "cannot load %s\n", argv[index]);
            return 1;
        }
        listed += plugins;
    }
    std::printf("%d plug-ins, %ld KiB\n", listed, peakMemory());
    return 0;
}
