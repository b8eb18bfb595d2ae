#pragma once

#include "Core/BaseLib/Files/TextFile.h"

#include <QStringList>

/// What came of asking that plug-ins be probed again.
struct RetryOutcome {
    int plugins = 0;     ///< so many get another chance
    QStringList unknown; ///< names that no plug-in bears which is out of use; nothing is changed then
    FileResult written;
};

/// Has the next scan probe plug-ins again that do not work or ended the scanner: their records lose the time
/// stamp that keeps the file from being touched, and keep the user's marks. What the user switched off stays
/// so.
///
/// `names` are names of plug-ins, of their files, or paths; none: all. A file in the folders to be scanned
/// that has no record is probed in any case.
RetryOutcome retryPlugins(const QString &effectsFolder, const QStringList &names, const QStringList &folders);
