#include "Core/BaseLib/Binary/PluginLibrary.h"

#include "Core/BaseLib/Binary/posix/ImportSearch.h"
#include "Core/BaseLib/Files/NativeFile.h"

#include <QFile>

#include <dlfcn.h>
#include <link.h>

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

bool PluginLibrary::isMapped(const QString &path)
{
    QString wanted = path;
    const auto isWanted = [](dl_phdr_info *library, std::size_t, void *data) {
        const QString name = QFile::decodeName(library->dlpi_name);
        const QString &of = *static_cast<const QString *>(data);
        return !name.isEmpty() && (name == of || isBelow(name, of)) ? 1 : 0;
    };
    return dl_iterate_phdr(isWanted, &wanted) != 0;
}

bool PluginLibrary::hasNeededLibraries(const QString &path)
{
    return whyNotLoadable(path, importSearch(path)).isEmpty();
}

QString PluginLibrary::fileEnding() { return QStringLiteral(".so"); }
