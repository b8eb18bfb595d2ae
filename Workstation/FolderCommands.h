#pragma once

#include <QString>

struct ScanOptions;

/// Whether the command line changes what is remembered of folders, and makes no scan.
bool isFolderCommand(const ScanOptions &options);

/// Does what it asks for: forgets, excludes and ignores folders and plug-ins, or takes that back. The scan
/// lock must be held. The exit code.
int runFolderCommand(const ScanOptions &options, const QString &effectsFolder);

/// Prints the folders that a scan searches, and those that it leaves alone, with the number of plug-ins known
/// in each: for people as a table, for programs a line each, folder, number and remark with tabs between
/// them. The exit code.
int printFolders(const QString &effectsFolder);
