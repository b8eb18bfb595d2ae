#include "Core/BaseLib/PluginLibrary.h"

#include <QFile>

#include <cerrno>
#include <cstring>

#include <dlfcn.h>

namespace {

/// The loader passes over a library for another processor as if it were not there, and then says so.
QString withTheFilesPresence(const QString &loaderText, const QString &path)
{
    const QString missing = QString::fromLocal8Bit(std::strerror(ENOENT));
    if (loaderText.startsWith(path) && loaderText.endsWith(missing) && QFile::exists(path))
        return loaderText + QStringLiteral(" (the file is there, perhaps built for another machine)");
    return loaderText;
}

} // namespace

void *PluginLibrary::loadUncached(const QString &path) noexcept
{
    if (path.isEmpty()) { // dlopen would answer with the program itself
        m_errorText = QStringLiteral("no path given");
        return nullptr;
    }
    // Bound at once: with lazy binding a missing symbol ends the process in the middle of a call; this way it
    // is a reason.
    void *handle = dlopen(QFile::encodeName(path).constData(), RTLD_NOW | RTLD_LOCAL);
    if (!handle)
        m_errorText = withTheFilesPresence(QString::fromLocal8Bit(dlerror()), path);
    return handle;
}

void *PluginLibrary::symbol(const char *name) const { return m_handle ? dlsym(m_handle, name) : nullptr; }

void PluginLibrary::free()
{
    if (useProcessCache || !m_handle)
        return;
    dlclose(m_handle);
    m_handle = nullptr;
}
