#pragma once

#include "Core/BaseLib/Binary/PluginLibrary.h"

#include <QString>

namespace Steinberg {
class IPluginFactory;
}

/// One opened VST 3 module: its library, started, and its factory. Used on one thread.
///
/// The order is always: load the library, start it, get the factory (once), …, release the factory, end,
/// unload.
class VST3Module {
public:
    VST3Module() = default;
    /// Closes the module.
    ~VST3Module();
    VST3Module(const VST3Module &) = delete;
    VST3Module &operator=(const VST3Module &) = delete;

    /// Loads and starts the module. False when either fails, with the failed step and the system's reason in
    /// the log. A module that was loaded but reports that it could not start is ended and unloaded by
    /// `close()` all the same.
    bool open(const QString &path);
    /// The factory, asked for once; owned by the module. Null when the module exports none or answers null.
    Steinberg::IPluginFactory *factory();
    /// Whether the loaded module exports the function that gives a factory.
    bool exportsFactory() const;
    /// Releases the factory, ends the module and unloads it. A module that left threads running stays mapped.
    /// Exceptions of the module are logged and go no further.
    void close();

private:
    void load();
    template <typename Step>
    void closeStep(Step step);

    QString m_path;
    PluginLibrary m_library;
    Steinberg::IPluginFactory *m_factory = nullptr;
    bool m_initialised = false;
};
