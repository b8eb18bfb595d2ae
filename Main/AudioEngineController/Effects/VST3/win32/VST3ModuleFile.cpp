#include "Main/AudioEngineController/Effects/VST3/VST3ModuleFile.h"

#include "Core/BaseLib/Files/FileTime.h"

#include <pluginterfaces/base/ftypes.h>

#include <QDir>
#include <QFileInfo>

namespace {

// Bundle layout, module name and entry functions are those of the VST 3 documentation, "Plug-in format
// structure" (Windows).
constexpr char kContents[] = ".vst3/Contents/";
constexpr char kBinaryFolder[] = "x86_64-win/";

using EntryFunction = bool(PLUGIN_API *)();

bool holdsModuleForUs(const QString &bundle)
{
    const QDir folder(bundle + QLatin1String("/Contents/") + QLatin1String(kBinaryFolder));
    return !folder.entryList({QStringLiteral("*.vst3")}, QDir::Files).isEmpty();
}

} // namespace

bool VST3ModuleFile::isModule(const QString &path)
{
    const int contents = path.lastIndexOf(QLatin1String(kContents), -1, Qt::CaseInsensitive);
    if (contents >= 0) { // beside ours, a bundle may hold the modules of other systems and machines
        const QString inside = path.mid(contents + static_cast<int>(sizeof kContents) - 1);
        return inside.startsWith(QLatin1String(kBinaryFolder), Qt::CaseInsensitive);
    }
    // The search enters a bundle and finds the module inside.
    return !QFileInfo(path).isDir() || !holdsModuleForUs(path);
}

QString VST3ModuleFile::binary(const QString &path, QString &reason)
{
    if (!QFileInfo(path).isDir())
        return path;
    reason = whyNoBinary(path, QStringLiteral("x86_64-win"));
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
