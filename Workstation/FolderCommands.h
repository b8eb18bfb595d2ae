#pragma once

#include <QString>

struct ScanOptions;

/// Whether the command line changes what is remembered of folders, and makes no scan.
bool isFolderCommand(const ScanOptions &options);

/// Does what it asks for: forgets, excludes and ignores folders and plug-ins, or takes that back. The scan
/// lock must be held. The exit code.
int runFolderCommand(const ScanOptions &options, const QString &effectsFolder);

/// Prints the folders: for people with what is known of each; for programs those that a scan searches, one a
/// line. The exit code.
int printFolders(const QString &effectsFolder);
