#pragma once

#include "Core/BaseLib/Files/TextFile.h"

#include <QStringList>

/// Name of the file, appended to the Effects folder.
inline constexpr char kFolderRulesFile[] = "/FXFolders.json";

/// What the user wants left alone in the folders to scan. The workstation writes it, the scanner only reads
/// it.
struct FolderRules {
    QStringList excluded; ///< folders, and what is below them, that are never searched; full paths
    QStringList ignored;  ///< modules, and what is below folders, that are found and never loaded; full paths
    /// Why a file that is there cannot be used; nothing is in the lists then. Whoever cannot know what not to
    /// load must not load anything.
    QString reason;

    explicit operator bool() const { return reason.isEmpty(); }
    /// Whether a module that was found must not be loaded, by whatever path. Asks the system where links
    /// lead.
    bool isIgnored(const QString &path) const;
};

/// Reads the rules of an Effects folder. A missing file holds none.
FolderRules readFolderRules(const QString &effectsFolder);

/// Replaces the file.
FileResult writeFolderRules(const QString &effectsFolder, const FolderRules &rules);

/// The paths of the environment variable "FXPROBE_ONLY": a scan searches only these and keeps what is known
/// of all others. They stand one a line, or, where the text has no end of a line, are separated as in PATH.
/// None where the variable is not set, or empty.
QStringList searchedOnly();

/// The value of that variable for some paths, which may hold what separates others in PATH.
QString searchedOnlyText(const QStringList &paths);
