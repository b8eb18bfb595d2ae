#pragma once

#include "Core/BaseLib/FolderListing.h"

#include <QString>
#include <QStringList>

#include <functional>
#include <memory>

/// Finds files and folders by the end of their name, in a folder and all folders below it. Looks into each
/// folder once in its life.
class FileFinder {
public:
    /// `ending` is the end of the names looked for, with its dot (".vst3"), compared without regard to case.
    explicit FileFinder(const QString &ending);

    /// Asked before each folder; the search ends early when it answers true.
    void setCancelled(std::function<bool()> cancelled) { m_cancelled = std::move(cancelled); }

    /// Has it share with others what they saw in the folders; not null.
    void setListings(std::shared_ptr<FolderListings> listings) { m_listings = std::move(listings); }

    /// The full paths found, "/" as separator: those of a folder in the order of their names, followed by
    /// what lies in its sub-folders. A folder that matches is listed and searched. Hidden entries are passed
    /// over and linked folders are not entered; junctions are (people keep plug-ins on other drives by them),
    /// unless one leads back to where the search comes from: it cannot loop. Names that are no valid text
    /// are passed over. A folder that cannot be read, or an empty path, gives one log line.
    QStringList find(const QString &folder) const;

    /// Lets folders that cannot be read be reported anew.
    static void forgetReports();

private:
    void searchFolder(const QString &folder, QStringList &found) const;

    QString m_ending;
    std::function<bool()> m_cancelled;
    std::shared_ptr<FolderListings> m_listings = std::make_shared<FolderListings>();
};
