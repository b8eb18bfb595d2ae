#pragma once

#include "Core/BaseLib/Files/TextFile.h"

#include <QStringList>

/// Name of the scan list, appended to the Effects folder.
inline constexpr char kScanListFile[] = "/FXScan.xml";

/// The data folder that a scan list belongs to: the text before the last "/Effects/" of its path, else before
/// the last
/// "\Effects\"; empty when neither occurs.
QString dataFolderOf(const QString &scanListPath);

/// The folders to scan, in the order of the file; none when the file is missing or not well-formed.
QStringList ReadScanList(const QString &path);

/// Writes the list of folders to scan, replacing the file.
FileResult WriteScanList(const QString &path, const QStringList &folders);
