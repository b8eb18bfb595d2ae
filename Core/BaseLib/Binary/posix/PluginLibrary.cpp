#include "Core/BaseLib/Binary/PluginLibrary.h"

#include "Core/BaseLib/Binary/PagedFile.h"
#include "Core/BaseLib/Binary/PeFormat.h"
#include "Core/BaseLib/Binary/posix/ElfTables.h"

#include <QFile>

#include <utility>

#include <dlfcn.h>
#include <elf.h>

namespace {

/// What a file is, where its first bytes say that it is not for this machine; else empty.
QString foreignKind(const QString &path)
{
    PagedFile file(path);
    if (file.content().item<quint16>(0) == kDosMagic)
        return QStringLiteral("a Windows library");
    const std::optional<quint16> machine = elfMachine(file.content());
    if (!machine || *machine == EM_X86_64)
        return QString();
    for (const auto &[number, name] : {std::pair(EM_386, "32-bit x86"), std::pair(EM_ARM, "32-bit ARM"),
                                       std::pair(EM_AARCH64, "64-bit ARM"), std::pair(EM_RISCV, "RISC-V")})
        if (*machine == number)
            return QStringLiteral("built for ") + QLatin1String(name);
    return QStringLiteral("built for another machine");
}

/// The loader's message for a file of another machine names the field that surprised it; for another
/// processor's it may even say that the file is not there.
QString withForeignKind(const QString &loaderText, const QString &path)
{
    const QString kind = loaderText.startsWith(path) ? foreignKind(path) : QString();
    return kind.isEmpty() ? loaderText : QStringLiteral("%1 (the file is %2)").arg(loaderText, kind);
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
        m_errorText = withForeignKind(QString::fromLocal8Bit(dlerror()), path);
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

QString PluginLibrary::fileEnding() { return QStringLiteral(".so"); }
