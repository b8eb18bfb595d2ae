#include "Core/BaseLib/Binary/PluginLibrary.h"

#include "Core/BaseLib/Binary/posix/ImportSearch.h"
#include "Core/BaseLib/Files/NativeFile.h"

#include <QFile>
#include <QRegularExpression>

#include <cstdlib>
#include <memory>

#include <cxxabi.h>
#include <dlfcn.h>
#include <link.h>

namespace {

/// A symbol as it stands in the source; as it is where it does not come from C++.
QString sourceName(const QString &symbol)
{
    const std::unique_ptr<char, decltype(&std::free)> text(
        abi::__cxa_demangle(symbol.toLocal8Bit().constData(), nullptr, nullptr, nullptr), &std::free);
    return text ? QString::fromLocal8Bit(text.get()) : symbol;
}

/// The GNU loader's message on a library that lacks something as a phrase about "it"; empty for others.
QString lackIn(const QString &loaderText)
{
    static const QRegularExpression version(
        QStringLiteral("([^/]+): version `(.+)' not found \\(required by .*\\)$"));
    static const QRegularExpression symbol(QStringLiteral("^(?:.*?([^/]+): )?undefined symbol: ([^\\s,]+)"));
    if (const auto match = version.match(loaderText); match.hasMatch())
        return QStringLiteral("%1version %2 of %3, which is not installed")
            .arg(QLatin1String(kNeedsLibrary), match.captured(2), match.captured(1));
    const auto match = symbol.match(loaderText);
    if (!match.hasMatch())
        return QString();
    const QString library = match.captured(1), name = sourceName(match.captured(2));
    const QString lack =
        library.isEmpty()
            ? QStringLiteral("the symbol \"%1\", which none of its libraries has").arg(name)
            : QStringLiteral("%1, which needs the symbol \"%2\" that no library has").arg(library, name);
    return QLatin1String(kNeedsLibrary) + lack;
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
    if (handle)
        return handle;
    QString text = QString::fromLocal8Bit(dlerror());
    text.remove(path + QLatin1String(": "));
    const QString lack = lackIn(text);
    setErrorText(path, importSearch(path), lack.isEmpty() ? notLoaded(text) : lack);
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

ModuleInspection PluginLibrary::inspect(const QString &path, const std::vector<QByteArray> &exports)
{
    ModuleInspection module = inspectModule(path, exports);
    if (!module.isLoadable())
        return module;
    const QString reason = whyCutShort(path, namedFolderSearch(path));
    return reason.isEmpty() ? module : ModuleInspection{ModuleInspection::Verdict::CutShort, reason};
}

QString PluginLibrary::fileEnding() { return QStringLiteral(".so"); }
