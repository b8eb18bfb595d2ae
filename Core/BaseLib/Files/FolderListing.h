#pragma once

#include <QString>

#include <vector>

/// An entry of a folder.
struct FolderEntry {
    QString name;
    bool isRealFolder; ///< a folder, and no link to one
};

struct FolderContent {
    std::vector<FolderEntry> entries;
    /// In the system's words, why not all of a folder that is there could be read.
    QString problem;
};

/// What lies in a folder, in the order of the names. Left out is what is hidden, special, a link to nothing,
/// or named by no valid text. Empty when there is no such folder.
FolderContent listFolder(const QString &folder);

/// The system's part of it, in any order.
FolderContent readFolder(const QString &folder);
