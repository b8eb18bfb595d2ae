#include "Main/AudioEngineController/Effects/VST3/VST3ModuleFile.h"

#include "Core/BaseLib/Binary/LoadFailure.h"
#include "Core/BaseLib/Files/FolderListing.h"
#include "Core/BaseLib/Files/NativeFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <QRegularExpression>

namespace {

/// The folders of machines and systems other than this one ("aarch64-linux") that are not empty.
QStringList otherMachines(const FolderContent &contents, const QString &path, const char *machine)
{
    static const QRegularExpression pattern(QStringLiteral("^(.+-(linux|win)|MacOS)$"));
    QStringList machines;
    for (const FolderEntry &entry : contents.entries)
        if (entry.isFolder && pattern.match(entry.name).hasMatch() &&
            !isSamePath(entry.name, QLatin1String(machine)) &&
            !listFolder(path + QLatin1Char('/') + entry.name).entries.empty())
            machines.append(entry.name);
    return machines;
}

} // namespace

QString VST3ModuleFile::machineFolder(const QString &bundle, const char *machine)
{
    return bundle + QLatin1String(kBundleContents) + QLatin1Char('/') + QLatin1String(machine);
}

QString VST3ModuleFile::whyNoBinary(const QString &bundle, const char *machine)
{
    const QString path = bundle + QLatin1String(kBundleContents);
    const FolderContent contents = listFolder(path);
    for (const QString &problem : {contents.problem, listFolder(machineFolder(bundle, machine)).problem})
        if (!problem.isEmpty())
            return QLatin1String(kBundleClosed) + problem;
    const QStringList machines = otherMachines(contents, path, machine);
    if (!machines.isEmpty())
        return QLatin1String(kBundleFor) + machines.join(QLatin1String(", ")) + QLatin1String(" only");
    return QLatin1String(kBundleHas) + QLatin1String("no module in Contents/") + QLatin1String(machine);
}
