#pragma once

#include <QHash>
#include <QString>

#include <memory>
#include <vector>

/// An entry of a folder.
struct FolderEntry {
    QString name;
    bool isRealFolder; ///< a folder, and no link to one
};

/// What lies in a folder, in the order of the names. Left out is what is hidden, special, a link to nothing,
/// or named by no valid text. Empty when the folder cannot be read.
std::vector<FolderEntry> listFolder(const QString &folder);

/// The system's part of it, in any order.
std::vector<FolderEntry> readFolder(const QString &folder);

/// Remembers what lay in folders, so that several searches of one scan walk through them once. Used on one
/// thread.
class FolderListings {
public:
    using Listing = std::shared_ptr<const std::vector<FolderEntry>>;

    /// As `listFolder` saw it first.
    Listing list(const QString &folder);

private:
    QHash<QString, Listing> m_listings;
};
