#pragma once

#include "Workstation/Options/ScanOptions.h"

class PluginHost;

/// Changes the marks that the command line names, and prints each change. Returns the exit code. Whoever
/// calls has the locks of the folder.
int changeMarks(const ScanOptions &options, const QString &effectsFolder);

/// Has the next scan ask again what the command line says. `folders` are those that it searches, `shown`
/// those of them that it was limited to, if it was. Returns the exit code when that cannot be done, else
/// `ScanExit::kDone`.
int prepareAskAgain(const ScanOptions &options, const QStringList &folders, const QStringList &shown,
                    PluginHost &registry);
