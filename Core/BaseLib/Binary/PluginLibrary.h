#pragma once

#include "Core/BaseLib/Binary/LoadFailure.h"
#include "Core/BaseLib/Binary/ModuleFile.h"

#include <QString>

#include <set>
#include <string>

/// One dynamic library handle. Loading runs the library's own start-up code on the calling thread.
class PluginLibrary {
public:
    PluginLibrary() = default;
    /// Frees the library as `free()` does.
    ~PluginLibrary();
    PluginLibrary(const PluginLibrary &) = delete;
    PluginLibrary &operator=(const PluginLibrary &) = delete;

    /// Loads the library with this full path. True when a handle was obtained; otherwise `errorText()` says
    /// why.
    bool load(const std::wstring &path);
    bool load(const QString &path);
    /// The address of an exported symbol, or null.
    void *symbol(const char *name) const;
    /// Unloads the library, unless the process cache keeps it.
    void free();
    /// Drops the handle and leaves the library mapped for the rest of the process.
    void leaveMapped();
    /// Unloads the library, unless more threads run than before it was loaded: a thread in unmapped code
    /// would kill the process while another library is being blamed. Such a library stays mapped, with a log
    /// line; false then.
    bool freeUnlessRunning();

    bool isLoaded() const { return m_handle != nullptr; }
    /// What was loaded last; empty before.
    const QString &path() const { return m_path; }
    /// The system's handle, or null.
    void *handle() const { return m_handle; }
    /// Why the last load failed, as a phrase about "it": libraries that it needs, or the system's message.
    const QString &errorText() const { return m_errorText; }

    /// What `inspectModule` tells, and where the system's loader does not look at the sizes of files before
    /// it maps them, also whether libraries that the module brings along are cut short.
    static ModuleInspection inspect(const QString &path, const std::vector<QByteArray> &exports = {});

    /// The end of the names of the system's libraries, with its dot.
    static QString fileEnding();
    /// Whether a library is mapped into this process that lies at the path, or in the bundle there.
    static bool isMapped(const QString &path);
    /// Whether all libraries that one needs are there and can be loaded; nothing is loaded to find out.
    static bool hasNeededLibraries(const QString &path);
    /// Whether a file exists at the path.
    static bool exists(const QString &path);

    /// When set, handles are remembered in one process-wide table by full path and never freed.
    bool useProcessCache = false;
    /// When set, the library's own folder is searched first for its dependencies. Only Windows has this
    /// switch; elsewhere a library names that folder itself.
    bool searchDllLoadDir = false;

private:
    /// Asks the system's loader; null on failure, with `m_errorText` set. What a library's start-up code
    /// throws ends the process: it would leave the loader in the middle of its work, with its lock held.
    void *loadUncached(const QString &path) noexcept;

    /// What the files tell comes first: the loader names one of several missing libraries, or none.
    /// `loaderReason` is a phrase about "it".
    void setErrorText(const QString &path, const LibrarySearch &search, const QString &loaderReason);
    /// The phrase for a loader's message that has no better one.
    static QString notLoaded(const QString &loaderText);

    void *m_handle = nullptr;
    QString m_path;
    std::set<int> m_threadsBefore; ///< threads of the process before the library was loaded
    QString m_errorText;
};
