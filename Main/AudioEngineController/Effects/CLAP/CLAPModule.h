#pragma once

#include "Core/BaseLib/Binary/ModuleFile.h"
#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeStage.h"

#include <functional>

struct clap_plugin_entry;
struct clap_plugin_factory;

/// One opened CLAP module: its library and its entry, initialised. Used on one thread.
///
/// The order is always: load the library, initialise the entry, ask for the factory, …, deinitialise, unload.
class CLAPModule {
public:
    using StageListener = std::function<void(ProbeStage)>;

    /// `stageEntered` hears of loading, starting and closing before the module is touched. It must not throw.
    explicit CLAPModule(StageListener stageEntered);
    /// Closes the module.
    ~CLAPModule();
    CLAPModule(const CLAPModule &) = delete;
    CLAPModule &operator=(const CLAPModule &) = delete;

    /// What can be seen of a module without loading it.
    static ModuleInspection inspect(const QString &path);
    /// Loads the library and initialises its entry. Why that failed, as a phrase about "it"; empty when it
    /// did not. A module whose entry refuses, or throws, which leaves this, is not called again.
    QString open(const QString &path);
    /// The plug-in factory of an open module, with all its functions, owned by the module. Null, with a
    /// reason, when it gives none that can be used. Exceptions of the module leave this.
    const clap_plugin_factory *factory(QString &reason);
    /// Deinitialises the entry and unloads the library. True when it left threads running, for which it stays
    /// mapped. Exceptions of the module are logged and go no further.
    bool close();

private:
    QString initialise();

    StageListener m_stageEntered;
    QString m_path;
    PluginLibrary m_library;
    const clap_plugin_entry *m_entry = nullptr; ///< null unless it is initialised
};
