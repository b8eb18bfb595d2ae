#pragma once

#include <QString>
#include <QStringList>

struct ScanOptions;

/// What a scan is about. The scan list is the memory of all folders that were ever scanned and not forgotten;
/// a scan of some of them leaves the list, and what is known of the others, as they are.
struct ScanFolders {
    QStringList listed;     ///< for the scan list
    QStringList searched;   ///< of those the only ones to search; none: all
    QStringList shown;      ///< whose plug-ins are printed; none: all
    QStringList leftOut;    ///< one sentence each
    QString unusable;       ///< why nothing can be scanned
    bool isDamaged = false; ///< because a file cannot be used that says what to scan and what not
};

/// Settles what to scan: the folders and modules given, and for none of them all that are remembered and the
/// usual ones that exist. A retry alone is about what is remembered.
ScanFolders foldersToScan(const ScanOptions &options, const QString &effectsFolder);

/// The path of a folder or module that a user gave: absolute; of something inside a bundle the bundle.
QString settledPath(const QString &given);
