#include "Main/AudioEngineController/Effects/VST3/VST3ModuleFile.h"

#include "Core/BaseLib/Binary/LoadFailure.h"
#include "Core/BaseLib/Files/FileTime.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <QDir>
#include <QFileInfo>

namespace {

// Bundle layout, module name and entry functions are those of the VST 3 documentation, "Plug-in format
// structure" (Linux).
constexpr char kMachine[] = "x86_64-linux";

using EntryFunction = bool (*)(void *libraryHandle);
using ExitFunction = bool (*)();

/// The module in a bundle that is as it should be.
QString usualBinary(const QString &bundle)
{
    return VST3ModuleFile::machineFolder(bundle, kMachine) + QLatin1Char('/') +
           QFileInfo(bundle).completeBaseName() + QLatin1String(".so");
}

/// The path, unless what it leads to exists and is not a regular file: reading a pipe would block.
QString unlessSpecial(const QString &path, QString &reason)
{
    const QFileInfo file(path);
    if (!file.exists() || file.isFile())
        return path;
    reason = QLatin1String(kUnopened) + QLatin1String("it is not a regular file");
    return QString();
}

} // namespace

bool VST3ModuleFile::isModule(const QString &path)
{
    // A bundle for several systems holds another system's module, which bears the same ending.
    return bundleOf(path).isEmpty();
}

QString VST3ModuleFile::binary(const QString &path, QString &reason)
{
    if (!QFileInfo(path).isDir())
        return unlessSpecial(path, reason);
    const QString folder = machineFolder(path, kMachine);
    const QString usual = usualBinary(path);
    if (QFileInfo::exists(usual))
        return unlessSpecial(usual, reason);
    const QStringList found = QDir(folder).entryList({QStringLiteral("*.so")}, QDir::Files);
    if (found.size() == 1)
        return folder + QLatin1Char('/') + found.first();
    reason = found.isEmpty()
                 ? whyNoBinary(path, kMachine)
                 : QLatin1String(kBundleHas) + QLatin1String("several modules and none of its own name");
    return QString();
}

QString VST3ModuleFile::fileTime(const QString &path)
{
    // One look is enough for a bundle as it should be; with many files it shows.
    const QString usual = fileTimeText(usualBinary(path));
    if (!usual.isEmpty())
        return usual;
    QString reason;
    const QString file = binary(path, reason);
    return fileTimeText(file.isEmpty() ? path : file);
}

bool VST3ModuleFile::start(PluginLibrary &library)
{
    const auto entry = reinterpret_cast<EntryFunction>(library.symbol("ModuleEntry"));
    return !entry || entry(library.handle());
}

void VST3ModuleFile::end(PluginLibrary &library)
{
    if (const auto exit = reinterpret_cast<ExitFunction>(library.symbol("ModuleExit")))
        exit();
}
