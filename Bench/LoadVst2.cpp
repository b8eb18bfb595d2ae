#include "Bench/LoadFloor.h"

#include "Main/AudioEngineController/Effects/VST/VSTInterface.h"

#include <cstring>
#include <vector>

#include <dlfcn.h>

namespace {

/// Room for texts, as much as the scan gives.
constexpr std::size_t kTextRoom = 1024 + 4096;

using HostCallback = VstIntPtr(AEffect *, VstInt32, VstInt32, VstIntPtr, void *, float);
using EntryPoint = AEffect *(*)(HostCallback *);

VstInt32 shellId = 0; ///< of the sub-plug-in whose entry point is being called

VstIntPtr answerPlugin(AEffect *, VstInt32 opcode, VstInt32, VstIntPtr, void *, float)
{
    switch (opcode) {
    case audioMasterVersion:
        return 2400;
    case audioMasterCurrentId:
        return shellId;
    case audioMasterGetSampleRate:
        return 44100;
    case audioMasterGetBlockSize:
        return 256;
    case audioMasterWantMidi:
    case audioMasterGetVendorVersion:
        return 1;
    default:
        return 0;
    }
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

} // namespace

int loadVst2(const char *path)
{
    void *const library = dlopen(path, RTLD_NOW | RTLD_LOCAL);
    if (!library)
        return -1;
    void *entry = dlsym(library, "VSTPluginMain");
    if (!entry)
        entry = dlsym(library, "main");
    const int listed = entry ? list(reinterpret_cast<EntryPoint>(entry)) : 0;
    dlclose(library);
    return listed;
}
