#pragma once

#include "Core/BaseLib/Files/TextFile.h"

#include <QStringList>

/// Names of the plug-ins whose marks change; see `pluginsNamed`.
struct MarkRequest {
    QStringList switchOff;
    QStringList switchOn;
    QStringList favourite;
    QStringList noFavourite;
};

/// What came of it.
struct MarkOutcome {
    QStringList done;  ///< a line for each plug-in
    QStringList wrong; ///< names that mean nothing, or several things; nothing is changed then
    FileResult written;
};

/// Changes the user's marks in the catalogues. What cannot be used is not switched off: it is disabled or
/// failed, and would count as good when it is switched on again. What is switched on and failed meanwhile is
/// not working.
MarkOutcome setMarks(const QString &effectsFolder, const MarkRequest &request);
