#pragma once

#include "Core/BaseLib/Files/TextFile.h"

#include <QString>

/// What came of forgetting a folder.
struct ForgetOutcome {
    int records = 0; ///< so many were dropped
    FileResult written;
};

/// Drops the records of all plug-ins below a folder from the catalogues, with the user's marks: of a drive
/// that is gone for good, for example.
ForgetOutcome forgetFolder(const QString &effectsFolder, const QString &folder);
