#include "Core/BaseLib/Binary/PluginLibrary.h"

#include "Core/BaseLib/Binary/posix/ImportSearch.h"

#include <QFile>

#include <dlfcn.h>

void *PluginLibrary::loadUncached(const QString &path) noexcept
{
    if (path.isEmpty()) { // dlopen would answer with the program itself
        m_errorText = QStringLiteral("no path given");
        return nullptr;
    }
    // Bound at once: with lazy binding a missing symbol ends the process in the middle of a call; this way it
    // is a reason.
    void *handle = dlopen(QFile::encodeName(path).constData(), RTLD_NOW | RTLD_LOCAL);
    if (handle)
        return handle;
    QString text = QString::fromLocal8Bit(dlerror());
    setErrorText(path, importSearch(path), text.remove(path + QLatin1String(": ")));
    return nullptr;
}

void *PluginLibrary::symbol(const char *name) const { return m_handle ? dlsym(m_handle, name) : nullptr; }

void PluginLibrary::free()
{
    if (useProcessCache || !m_handle)
        return;
    dlclose(m_handle);
    m_handle = nullptr;
}

QString PluginLibrary::fileEnding() { return QStringLiteral(".so"); }
