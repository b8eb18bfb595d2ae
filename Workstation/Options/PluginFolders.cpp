#include "Workstation/Options/PluginFolders.h"

#include "Core/BaseLib/Files/AnswerInTime.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <QDir>
#include <QFileInfo>
#include <QRegularExpression>
#include <QStandardPaths>

namespace {

QStringList foldersOfVariable(const char *name)
{
    return qEnvironmentVariable(name).split(QDir::listSeparator(), Qt::SkipEmptyParts);
}

} // namespace

bool canStandInScanList(const QString &folder)
{
    // The list is written without escaping, one folder a line, and read as XML.
    static const QRegularExpression bad(QStringLiteral("[<\\x00-\\x1f]|&[#a-zA-Z0-9]+;"));
    return !bad.match(folder).hasMatch();
}

QStringList foldersOfEnvironment()
{
    QStringList folders;
    for (const PluginFormatInfo &format : pluginFormats())
        for (const QByteArray &variable : QByteArray(format.folderVariables).split(' '))
            folders += foldersOfVariable(variable);
    return folders;
}

QStringList usualPluginFolders() { return foldersOfEnvironment() + platformPluginFolders(); }

QString userDataFolder()
{
    return QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation) + QStringLiteral("/FxProbe");
}

SettledFolders settleFolders(const QStringList &folders)
{
    SettledFolders settled;
    for (const QString &given : folders) {
        const QString folder = QDir::cleanPath(QFileInfo(given).absoluteFilePath());
        if (!given.isEmpty() && !answers(folder))
            settled.leftOut.append(QStringLiteral("the folder '%1' gives no answer").arg(given));
        else if (given.isEmpty() || !QFileInfo(folder).isDir())
            settled.leftOut.append(QStringLiteral("there is no folder '%1'").arg(given));
        else if (!canStandInScanList(folder))
            settled.leftOut.append(
                QStringLiteral("the name of the folder '%1' cannot stand in a scan list").arg(given));
        else if (!settled.folders.contains(folder))
            settled.folders.append(folder);
    }
    return settled;
}

QStringList existingUsualFolders() { return settleFolders(usualPluginFolders()).folders; }
