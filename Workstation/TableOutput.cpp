#include "Workstation/SummaryOutput.h"
#include "Workstation/Terminal.h"

#include <algorithm>
#include <array>

namespace {

constexpr std::size_t kColumns = 6;
using Row = std::array<QString, kColumns>;

/// The longest that a column gets, in terminal columns.
constexpr std::array<int, kColumns> kMaxWidths = {6, 40, 24, 24, 8, 12};

Row rowOf(const CataloguedPlugin &plugin)
{
    return {QString::fromLatin1(plugin.format->title),
            Terminal::harmless(plugin.record.name),
            Terminal::harmless(plugin.record.vendor),
            Terminal::harmless(plugin.categories().join(QLatin1String(", "))),
            channelsText(plugin),
            QString::fromLatin1(stateText(plugin.state()))};
}

QString renderRows(const std::vector<Row> &rows)
{
    std::array<int, kColumns> widths = {};
    for (const Row &row : rows)
        for (std::size_t column = 0; column < kColumns; ++column)
            widths[column] =
                std::min(kMaxWidths[column], std::max(widths[column], Terminal::width(row[column])));
    QString text;
    for (const Row &row : rows) {
        QString line;
        for (std::size_t column = 0; column < kColumns; ++column)
            line += Terminal::cell(row[column], widths[column]) + QLatin1String("  ");
        while (line.endsWith(QLatin1Char(' ')))
            line.chop(1);
        text += line + QLatin1Char('\n');
    }
    return text;
}

QString renderPlugins(const ScanSummary &summary)
{
    if (summary.plugins.empty())
        return QString();
    std::vector<Row> rows{{QStringLiteral("FORMAT"), QStringLiteral("NAME"), QStringLiteral("VENDOR"),
                           QStringLiteral("CATEGORY"), QStringLiteral("CHANNELS"), QStringLiteral("STATE")}};
    for (const CataloguedPlugin &plugin : summary.plugins)
        rows.push_back(rowOf(plugin));
    return renderRows(rows) + QLatin1Char('\n');
}

QString renderFailures(const ScanSummary &summary)
{
    QString text;
    for (const PluginFailure &failure : summary.failures)
        text += QStringLiteral("  %1 (%2, %3): %4.\n    %5\n")
                    .arg(Terminal::harmless(failure.name), QLatin1String(failure.format->title),
                         QLatin1String(stateText(failure.state)), Terminal::harmless(failure.reason),
                         Terminal::harmless(failure.path));
    return text.isEmpty() ? text : QStringLiteral("Cannot be used:\n") + text + QLatin1Char('\n');
}

QString renderProblems(const ScanSummary &summary)
{
    QString text;
    for (const QString &problem : summary.problems)
        text += QStringLiteral("Problem: %1.\n").arg(Terminal::harmless(problem));
    return text.isEmpty() ? text : text + QLatin1Char('\n');
}

QString renderSlowest(const ScanSummary &summary)
{
    QString text;
    for (const ProbeTime &probe : summary.slowest)
        text += QStringLiteral("  %1 ms  %2\n")
                    .arg(probe.milliseconds, 8, 'f', 1)
                    .arg(Terminal::harmless(probe.path));
    return text.isEmpty() ? text : QStringLiteral("Slowest:\n") + text + QLatin1Char('\n');
}

QString renderCounts(const ScanSummary &summary)
{
    QString text = QStringLiteral("%1 plug-ins").arg(summary.plugins.size());
    if (summary.isScan)
        text += QStringLiteral(": %1 new, %2 updated, %3 unchanged, %4 removed")
                    .arg(summary.added)
                    .arg(summary.updated)
                    .arg(summary.unchanged)
                    .arg(summary.removed.size());
    text += QStringLiteral(", %1 failed").arg(summary.failures.size());
    if (!summary.noPlugins.empty())
        text += QStringLiteral("; other files without a plug-in: %1").arg(summary.noPlugins.size());
    return text + QLatin1Char('\n');
}

} // namespace

QString channelsText(const CataloguedPlugin &plugin)
{
    const qint32 channels = plugin.hasWidth() ? plugin.record.width : plugin.record.inputs;
    if (!plugin.isUsable() || channels < 0)
        return QStringLiteral("-");
    return QString::number(channels) + (plugin.hasWidth() ? QLatin1String(" out") : QLatin1String(" in"));
}

QString renderTable(const ScanSummary &summary)
{
    return renderPlugins(summary) + renderFailures(summary) + renderProblems(summary) +
           renderSlowest(summary) + renderCounts(summary);
}
