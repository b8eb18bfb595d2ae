#pragma once

#include "Core/BaseLib/Files/TextFile.h"

#include <QStringList>

/// Name of the scan list, appended to the Effects folder.
inline constexpr char kScanListFile[] = "/FXScan.xml";

/// The data folder that a scan list belongs to: the text before the last "/Effects/" of its path, else before
/// the last
/// "\Effects\"; empty when neither occurs.
QString dataFolderOf(const QString &scanListPath);

/// The folders to scan, in the order of the file. Nothing is in the list, and `reason` says why, when the
/// file is there but cannot be opened or is not whole: a list that was cut short must not cost what lies in
/// the folders behind the cut.
struct ScanListContents {
    QStringList folders;
    QString reason;

    explicit operator bool() const { return reason.isEmpty(); }
};

/// Reads a scan list. A missing file gives an empty list.
ScanListContents ReadScanList(const QString &path);

/// Writes the list of folders to scan, replacing the file.
FileResult WriteScanList(const QString &path, const QStringList &folders);
