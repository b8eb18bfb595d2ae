#pragma once

#include "Core/BaseLib/Binary/ModuleFile.h"
#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTEffect.h"

#include <QString>

#include <vector>

class IVSTEffectOwner;

/// The function that a plug-in calls to talk to its host.
using VSTHostCallbackFunction = VstIntPtr (*)(AEffect *, VstInt32, VstInt32, VstIntPtr, void *, float);

/// What came of loading a module, or of calling its entry point.
struct VSTLoadResult {
    enum class Status {
        Done,
        NotLoaded,     ///< the system does not load the library
        NoEntryPoint,  ///< it is not a VST 2 module
        EntryFailed,   ///< the entry point threw or faulted; the module is to be unloaded
        NoEffect,      ///< the entry point returned null
        InvalidEffect, ///< the entry point returned something other than an effect
    };

    Status status = Status::Done;
    QString reason;   ///< one phrase, without the path; empty when done
    VSTEffect effect; ///< what a call of the entry point gave, when done

    bool isDone() const { return status == Status::Done; }
};

/// One VST 2 module: its library, its entry point, and every effect that it handed out. Used on one thread.
///
/// The order is always: load the library, call the entry point, once or for each sub-plug-in of a shell, …,
/// close the effects, the newest first and each once, unload. After a hardware fault in one of its calls the
/// module's state is unknown: no effect is closed then, and the library stays mapped.
class VSTModule {
public:
    VSTModule() = default;
    /// Unloads the module.
    ~VSTModule() { unload(); }
    VSTModule(const VSTModule &) = delete;
    VSTModule &operator=(const VSTModule &) = delete;

    /// What can be seen of a file without loading it. One that surely exports no entry point is not a module.
    static ModuleInspection inspect(const QString &path);

    bool isLoaded() const { return m_library.isLoaded(); }
    /// Loads the library, unless one is loaded, and looks for its entry point.
    VSTLoadResult load(const QString &path);
    /// Calls the entry point of a loaded module. The host callback answers for the owner meanwhile, and the
    /// effect knows the owner from then on.
    VSTLoadResult enter(VSTHostCallbackFunction callback, IVSTEffectOwner &owner);

    /// Whether there is an effect to close.
    bool hasOpenEffect() const { return !m_handedOut.empty() && !hasFaulted(); }
    /// The sub-plug-in that the newest effect was made for; 0: none.
    VstInt32 newestShellId() const { return m_handedOut.back().shellId; }
    void closeNewestEffect();
    /// Closes the effects that are still open and unloads the library. False when it stays mapped, because
    /// the module faulted or left threads running.
    bool unload();

    /// Whether a call of the module now loaded committed a hardware fault.
    bool hasFaulted() const;

private:
    /// An effect, and the sub-plug-in it was made for (0: none).
    struct HandedOut {
        VSTEffect effect;
        VstInt32 shellId;
    };

    VSTLoadResult takeOver(AEffect *effect, IVSTEffectOwner &owner);

    PluginLibrary m_library;
    void *m_entryPoint = nullptr;
    std::vector<HandedOut> m_handedOut; ///< those that were not closed yet, in order
    bool m_faulted = false;             ///< in the entry point, or in an effect that is closed
};

/// Logs that a plug-in of the catalogue could not be loaded. The caller logs why.
void logFailedLoad(const QString &path, const VSTLoadResult &result);
