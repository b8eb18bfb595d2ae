#pragma once

#include "Core/BaseLib/Binary/ModuleFile.h"
#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeStage.h"

#include <QString>

#include <functional>
#include <optional>

namespace Steinberg {
class IPluginFactory;
}

/// Why a module cannot be used.
struct VST3Failure {
    QString step;   ///< what failed, as the log names it
    QString reason; ///< the cause, as a user can understand it; without the path
};

/// One opened VST 3 module: its library, started, and its factory. Used on one thread.
///
/// The order is always: load the library, start it, get the factory (once), …, release the factory, end,
/// unload.
class VST3Module {
public:
    using StageListener = std::function<void(ProbeStage)>;

    /// `stageEntered` hears of loading, starting and closing before the module is touched. It must not throw.
    explicit VST3Module(StageListener stageEntered = [](ProbeStage) {});
    /// Closes the module.
    ~VST3Module();
    VST3Module(const VST3Module &) = delete;
    VST3Module &operator=(const VST3Module &) = delete;

    /// What can be seen of a module without loading it.
    static ModuleInspection inspect(const QString &path);
    /// Loads and starts the module; nothing when that succeeded. A module that was loaded but reports that it
    /// could not start is ended and unloaded by `close()` all the same. Exceptions of its entry function
    /// leave this.
    std::optional<VST3Failure> open(const QString &path);
    /// The factory, asked for once; owned by the module. Null when the module exports none or answers null.
    /// Exceptions of the module leave this.
    Steinberg::IPluginFactory *factory();
    /// Gives the caller a reference to the factory; nothing when there is one that can be used.
    std::optional<VST3Failure> queryFactory(Steinberg::IPluginFactory *&found);
    /// Releases the factory, ends the module and unloads it. True when it left threads running, for which it
    /// stays mapped. Exceptions of the module are logged and go no further.
    bool close();

private:
    QString load();
    template <typename Step>
    void closeStep(Step step);

    StageListener m_stageEntered;
    QString m_path;
    PluginLibrary m_library;
    Steinberg::IPluginFactory *m_factory = nullptr;
    bool m_initialised = false;
};
