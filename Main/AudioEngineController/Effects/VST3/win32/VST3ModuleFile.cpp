#include "Main/AudioEngineController/Effects/VST3/VST3ModuleFile.h"

#include "Core/BaseLib/Files/FileTime.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <pluginterfaces/base/ftypes.h>

#include <QDir>
#include <QFileInfo>

namespace {

// Bundle layout, module name and entry functions are those of the VST 3 documentation, "Plug-in format
// structure" (Windows).
constexpr char kMachine[] = "x86_64-win";

using EntryFunction = bool(PLUGIN_API *)();

bool holdsModuleForUs(const QString &bundle)
{
    const QDir folder(VST3ModuleFile::machineFolder(bundle, kMachine));
    const QString pattern = QLatin1Char('*') + formatInfo(PluginFormat::Vst3).moduleEnding;
    return !folder.entryList({pattern}, QDir::Files).isEmpty();
}

} // namespace

bool VST3ModuleFile::isModule(const QString &path)
{
    const QString bundle = bundleOf(path);
    if (!bundle.isEmpty()) // beside ours, it may hold the modules of other systems and machines
        return path.startsWith(machineFolder(bundle, kMachine) + QLatin1Char('/'), Qt::CaseInsensitive);
    // The search enters a bundle and finds the module inside.
    return !QFileInfo(path).isDir() || !holdsModuleForUs(path);
}

QString VST3ModuleFile::binary(const QString &path, QString &reason)
{
    if (!QFileInfo(path).isDir())
        return path;
    reason = whyNoBinary(path, kMachine);
    return QString();
}

QString VST3ModuleFile::fileTime(const QString &path) { return fileTimeText(path); }

bool VST3ModuleFile::start(PluginLibrary &library)
{
    const auto entry = reinterpret_cast<EntryFunction>(library.symbol("InitDll"));
    return !entry || entry();
}

void VST3ModuleFile::end(PluginLibrary &library)
{
    if (const auto exit = reinterpret_cast<EntryFunction>(library.symbol("ExitDll")))
        exit();
}
