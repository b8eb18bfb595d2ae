#include "Workstation/ScanFolders.h"

#include "Core/BaseLib/Files/AnswerInTime.h"
#include "Core/BaseLib/Files/SearchArea.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/Protocol/FolderRules.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"
#include "Workstation/Options/PluginFolders.h"
#include "Workstation/Options/ScanOptions.h"

#include <QDir>
#include <QFileInfo>

#include <algorithm>

namespace {

bool isModuleName(const QString &path)
{
    const auto &formats = pluginFormats();
    return std::any_of(formats.begin(), formats.end(), [&](const PluginFormatInfo &format) {
        return format.isScanned() && path.endsWith(format.moduleEnding, Qt::CaseInsensitive);
    });
}

bool hasRecordsBelow(const QString &folder, const QString &effectsFolder)
{
    const auto lies = [&](const EffectRecord &record) { return isBelow(record.path, folder); };
    const auto &formats = pluginFormats();
    return std::any_of(formats.begin(), formats.end(), [&](const PluginFormatInfo &format) {
        if (!format.isScanned())
            return false;
        const QString file = effectsFolder + QLatin1String(format.catalogue->fileName);
        const std::vector<EffectRecord> records = readCatalogueFile(*format.catalogue, file).records;
        return std::any_of(records.begin(), records.end(), lies);
    });
}

/// What is remembered and what is usual. A usual folder that is gone with all that was in it is let go, and
/// so is a module that is not in its folder any more.
QStringList allFolders(QStringList remembered, const QStringList &excluded, const QString &effectsFolder)
{
    const QStringList usual = usualPluginFolders();
    const auto isGone = [&](const QString &path) {
        const QFileInfo file(path);
        return answers(path) &&
               (usual.contains(path) ? !file.isDir()
                                     : !file.exists() && !file.isSymLink() && file.dir().exists());
    };
    const auto isOver = [&](const QString &path) {
        return (usual.contains(path) || isModuleName(path)) && !hasRecordsBelow(path, effectsFolder) &&
               isGone(path);
    };
    remembered.erase(std::remove_if(remembered.begin(), remembered.end(), isOver), remembered.end());
    for (const QString &folder : existingUsualFolders())
        if (!remembered.contains(folder) && !isBelowAny(folder, excluded))
            remembered.append(folder);
    return remembered;
}

/// What was given, as paths for a scan list.
QStringList settleGiven(const QStringList &given, const QStringList &excluded, QStringList &leftOut)
{
    QStringList paths;
    for (const QString &each : given) {
        const QString path = settledPath(each);
        if (!answers(path)) {
            leftOut.append(QStringLiteral("'%1' gives no answer").arg(each));
            continue;
        }
        const QFileInfo file(path);
        if (path.isEmpty() || !file.exists())
            leftOut.append(QStringLiteral("there is no folder or plug-in '%1'").arg(each));
        else if (!file.isDir() && !(file.isFile() && isModuleName(path)))
            leftOut.append(QStringLiteral("'%1' is neither a folder nor a plug-in").arg(each));
        else if (isBelowAny(path, excluded))
            leftOut.append(QStringLiteral("'%1' is excluded; --no-exclude takes that back").arg(each));
        else if (!canStandInScanList(path))
            leftOut.append(QStringLiteral("the name of '%1' cannot stand in a scan list").arg(each));
        else if (!paths.contains(path))
            paths.append(path);
    }
    return paths;
}

} // namespace

QString settledPath(const QString &given)
{
    if (given.isEmpty()) // made absolute, it would be the working folder
        return given;
    const QString path = QDir::cleanPath(QFileInfo(given).absoluteFilePath());
    const QString bundle = bundleOf(path + QLatin1Char('/'));
    return bundle.isEmpty() ? path : bundle;
}

ScanFolders foldersToScan(const ScanOptions &options, const QString &effectsFolder)
{
    ScanFolders folders;
    const ScanListContents remembered = ReadScanList(effectsFolder + QLatin1String(kScanListFile));
    const FolderRules rules = readFolderRules(effectsFolder);
    if (!remembered || !rules) {
        folders.isDamaged = true;
        folders.unusable =
            QStringLiteral("%1%2 cannot be used, so nothing is scanned: %3; mend it or delete it")
                .arg(effectsFolder, QLatin1String(remembered ? kFolderRulesFile : kScanListFile),
                     remembered ? rules.reason : remembered.reason);
        return folders;
    }
    folders.listed = remembered.folders;
    if (options.folders.isEmpty()) {
        if (options.asksAgain() && !folders.listed.isEmpty())
            return folders;
        for (const QString &reason : settleFolders(foldersOfEnvironment()).leftOut)
            folders.leftOut.append(reason);
        folders.listed = allFolders(folders.listed, rules.excluded, effectsFolder);
        if (folders.listed.isEmpty())
            folders.unusable = QStringLiteral("none of the usual plug-in folders exists; name one");
        return folders;
    }
    folders.shown = settleGiven(options.folders, rules.excluded, folders.leftOut);
    if (folders.shown.isEmpty())
        folders.unusable = QStringLiteral("none of the folders given can be scanned");
    for (const QString &path : folders.shown)
        if (!isBelowAny(path, folders.listed))
            folders.listed.append(path);
    folders.searched = folders.shown;
    return folders;
}
