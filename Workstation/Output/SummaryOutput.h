#pragma once

#include "Workstation/Summary/ScanSummary.h"

#include <QByteArray>
#include <QJsonObject>
#include <QString>
#include <QStringList>

/// The summary as text for people. Columns of the table that do not fit into `width` are left out or cut; 0:
/// any width.
QString renderTable(const ScanSummary &summary, int width = 0);
/// The summary as JSON; docs/fxscan.schema.json describes it.
QByteArray renderJson(const ScanSummary &summary, const QString &dataFolder, const QStringList &folders);
/// The same as the last line of JSON lines.
QByteArray renderJsonLine(const ScanSummary &summary, const QString &dataFolder, const QStringList &folders);
/// The plug-ins, one a line, as comma-separated values with a line of titles (RFC 4180). A text that a
/// spreadsheet would take for a formula has "'" in front.
QByteArray renderCsv(const ScanSummary &summary);

/// The summary as a page for browsers that needs nothing else; page/page.html is its template.
QByteArray renderHtml(const ScanSummary &summary, const QString &dataFolder, const QStringList &folders);

/// The members of the JSON.
QJsonObject summaryObject(const ScanSummary &summary, const QString &dataFolder, const QStringList &folders);
/// How many plug-ins there are, by state, and what changed: one line with its end.
QString renderCounts(const ScanSummary &summary);
/// Channels of a plug-in as far as its catalogue or its last probe tells.
QString channelsText(const CataloguedPlugin &plugin);
