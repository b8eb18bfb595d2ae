#include "Core/BaseLib/Binary/PluginLibrary.h"

#include "Core/BaseLib/Binary/ElfFormat.h"

#include <QFile>

#include <utility>

#include <dlfcn.h>

namespace {

/// What a file was built for, where its first bytes say that it is not for this machine; else empty.
QString foreignKind(const QString &path)
{
    QFile file(path);
    // Up to the end of e_machine, which lies at the same place in files of 32 and 64 bits.
    const QByteArray start = file.open(QIODevice::ReadOnly) ? file.read(20) : QByteArray();
    if (start.startsWith("MZ"))
        return QStringLiteral("a Windows library");
    if (start.size() < 20 || !start.startsWith("\x7f"
                                               "ELF"))
        return QString();
    // System V Application Binary Interface, chapter 4 "ELF header"; here of little-endian machines.
    const int machine = static_cast<uchar>(start[18]) | static_cast<uchar>(start[19]) << 8;
    for (const auto &[number, name] : {std::pair(3, "32-bit x86"), std::pair(40, "32-bit ARM"),
                                       std::pair(183, "64-bit ARM"), std::pair(243, "RISC-V")})
        if (machine == number)
            return QStringLiteral("built for ") + QLatin1String(name);
    return machine == kElfMachineX86_64 ? QString() : QStringLiteral("built for another machine");
}

/// The loader tells files for other machines by what in them surprised it; for another processor's it even
/// says that they are not there.
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
