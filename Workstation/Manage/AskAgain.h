#pragma once

#include "Core/BaseLib/Files/TextFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <QStringList>

#include <functional>

/// Which plug-ins the next scan asks although their files did not change. Names are those of plug-ins, of
/// their files, or paths; see `pluginsNamed`.
struct AskAgainRequest {
    QStringList retry{};      ///< that do not work, or ended the scanner
    bool retryFailed = false; ///< all of those
    bool retryChanged =
        false; ///< those of them that may work now: their file changed, or a library is there that it lacked
    QStringList rescan{};   ///< that are asked like new ones; never one that ended the scanner
    QStringList below{};    ///< only what lies at or below these paths; none: anywhere
    bool rescanAll = false; ///< all of those
};

/// What can be told of modules on disk without loading them.
struct ModuleLook {
    /// The module's time stamp; empty when there is none.
    std::function<QString(PluginFormat format, const QString &path)> fileTime;
    /// Whether all libraries that it needs are there.
    std::function<bool(PluginFormat format, const QString &path)> hasLibraries;
};

/// What came of it.
struct AskAgainOutcome {
    QStringList wrong; ///< what of the request cannot be done, one sentence each; nothing is changed then
    FileResult written;
};

/// Has the next scan ask plug-ins again: their records lose the time stamp that keeps the file from being
/// touched, and keep the user's marks. What the user switched off stays so.
///
/// A name may be that of a file in `folders` that has no record: it is asked in any case.
AskAgainOutcome askAgain(const QString &effectsFolder, const AskAgainRequest &request,
                         const QStringList &folders, const ModuleLook &look);
