#pragma once

#include <QString>
#include <QStringList>

/// Where plug-ins usually lie on this platform, whether the folders exist or not, after those that the
/// environment variables of the formats name.
QStringList usualPluginFolders();

/// Those that the variables name alone.
QStringList foldersOfEnvironment();

/// Where fxscan keeps its files when no folder is given: below the platform's place for user data.
QString userDataFolder();

/// Folders to scan, settled: absolute, each once.
struct SettledFolders {
    QStringList folders;
    QStringList leftOut; ///< one sentence each
};

/// Whether a scan list can hold the name of a folder.
bool canStandInScanList(const QString &folder);

/// Settles folders that a user gave: those that do not exist, or whose names cannot stand in a scan list, are
/// left out with a reason.
SettledFolders settleFolders(const QStringList &folders);
/// The usual folders that exist.
QStringList existingUsualFolders();

/// The platform's own folders; the part that differs from system to system.
QStringList platformPluginFolders();
