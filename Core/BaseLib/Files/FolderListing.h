#pragma once

#include <QString>

#include <functional>
#include <vector>

/// An entry of a folder.
struct FolderEntry {
    QString name;
    bool isFolder; ///< or a link to one
    bool isLink;   ///< a symbolic link, or a junction of Windows
};

struct FolderContent {
    std::vector<FolderEntry> entries;
    /// The system's message for why an existing folder could not be read completely; empty when it could.
    QString problem;
    /// Folders and files whose names are not valid text, in a spelling for people.
    std::vector<FolderEntry> unnamed;
};

/// Asked before the system is asked where a link leads, which may take its time; false: it is left out.
using MayFollow = std::function<bool(const QString &name)>;

/// What lies in a folder, in the order of the names. Entries that are hidden, special, links to nothing, or
/// named by invalid text are left out. Empty when there is no such folder.
FolderContent listFolder(const QString &folder, const MayFollow &mayFollow = nullptr);

/// The system's part of it, in any order.
FolderContent readFolder(const QString &folder, const MayFollow &mayFollow);
