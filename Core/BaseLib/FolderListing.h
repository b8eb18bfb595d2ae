#pragma once

#include <QHash>
#include <QString>
#include <QStringList>

#include <memory>
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

/// Remembers what lay in folders, so that several searches of one scan walk through them once. Used on one
/// thread.
class FolderListings {
public:
    using Listing = std::shared_ptr<const FolderContent>;

    /// As `listFolder` saw it first.
    Listing list(const QString &folder);
    /// The folders so far of which not all could be read.
    const QStringList &unread() const { return m_unread; }

private:
    QStringList m_unread;
    QHash<QString, Listing> m_listings;
};
