#include "Workstation/Output/DuplicateText.h"
#include "Workstation/Output/FailureText.h"
#include "Workstation/Output/SummaryOutput.h"
#include "Workstation/Output/Terminal.h"

#include <algorithm>
#include <array>
#include <map>

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

/// What gives way first where a line has no room for all, and the least that the others need.
constexpr std::size_t kName = 1;
constexpr std::size_t kVendor = 2;
constexpr std::array<std::size_t, 2> kLeftOutFirst = {4, 3}; // channels, then categories
constexpr int kLeastName = 16;
constexpr int kLeastVendor = 8;
constexpr int kGap = 2;

using Widths = std::array<int, kColumns>; ///< 0: the column is left out

int lineWidth(const Widths &widths)
{
    int line = -kGap;
    for (const int width : widths)
        line += width == 0 ? 0 : width + kGap;
    return line;
}

/// Makes columns fit into a line.
void fit(Widths &widths, int line)
{
    for (const std::size_t column : kLeftOutFirst)
        if (lineWidth(widths) > line)
            widths[column] = 0;
    const auto shrink = [&](std::size_t column, int least) {
        const int excess = std::max(lineWidth(widths) - line, 0);
        widths[column] = std::min(widths[column], std::max(widths[column] - excess, least));
    };
    const int whole = widths[kName];
    shrink(kVendor, kLeastVendor);
    shrink(kName, kLeastName);
    if (lineWidth(widths) <= line)
        return;
    widths[kName] = whole;
    widths[kVendor] = 0;
    shrink(kName, 1);
}

QString renderRows(const std::vector<Row> &rows, int line)
{
    Widths widths = {};
    for (const Row &row : rows)
        for (std::size_t column = 0; column < kColumns; ++column)
            widths[column] =
                std::min(kMaxWidths[column], std::max(widths[column], Terminal::width(row[column])));
    if (line > 0)
        fit(widths, line);
    QString text;
    for (const Row &row : rows) {
        QString shown;
        for (std::size_t column = 0; column < kColumns; ++column)
            if (widths[column] > 0)
                shown += Terminal::cell(row[column], widths[column]) + QString(kGap, QLatin1Char(' '));
        while (shown.endsWith(QLatin1Char(' ')))
            shown.chop(1);
        text += shown + QLatin1Char('\n');
    }
    return text;
}

QString renderPlugins(const ScanSummary &summary, int width)
{
    if (summary.plugins.empty())
        return QString();
    std::vector<Row> rows{{QStringLiteral("FORMAT"), QStringLiteral("NAME"), QStringLiteral("VENDOR"),
                           QStringLiteral("CATEGORY"), QStringLiteral("IN/OUT"), QStringLiteral("STATE")}};
    for (const CataloguedPlugin &plugin : summary.plugins)
        rows.push_back(rowOf(plugin));
    return renderRows(rows, width) + QLatin1Char('\n');
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

/// "3 new", or nothing for none.
void addCount(QStringList &parts, std::size_t count, const char *what)
{
    if (count != 0)
        parts.append(QStringLiteral("%1 %2").arg(count).arg(QLatin1String(what)));
}

} // namespace

QString renderCounts(const ScanSummary &summary)
{
    std::map<PluginState, std::size_t> states;
    for (const CataloguedPlugin &plugin : summary.plugins)
        ++states[plugin.state()];
    for (const PluginFailure &failure : summary.failures)
        states[failure.state] += failure.isCatalogued ? 0 : 1;
    QStringList now;
    addCount(now, states[PluginState::Ok], "usable");
    for (const PluginState state :
         {PluginState::Failed, PluginState::Disabled, PluginState::SwitchedOff, PluginState::Ignored,
          PluginState::FolderAway, PluginState::FileGone, PluginState::NotAsked})
        addCount(now, states[state], stateText(state));
    QStringList changes;
    if (summary.isScan) {
        addCount(changes, static_cast<std::size_t>(summary.added), "new");
        addCount(changes, static_cast<std::size_t>(summary.updated), "updated");
        if (!summary.removed.isEmpty())
            changes.append(QStringLiteral("%1 gone: %2")
                               .arg(summary.removed.size())
                               .arg(Terminal::harmless(summary.removed.join(QLatin1String(", ")))));
        QStringList skipped;
        for (const QString &path : summary.skipped)
            skipped.append(Terminal::harmless(fileNameOf(path)));
        if (!skipped.isEmpty())
            changes.append(
                QStringLiteral("%1 skipped: %2").arg(skipped.size()).arg(skipped.join(QLatin1String(", "))));
    }
    const std::size_t count = countOf(summary);
    const std::size_t all = summary.all == 0 ? count : summary.all;
    const QString of = summary.all == 0 ? QString() : QStringLiteral("%1 of ").arg(count);
    QString text = QStringLiteral("%1%2 plug-in%3").arg(of).arg(all).arg(QLatin1String(all == 1 ? "" : "s"));
    if (!now.isEmpty())
        text += QLatin1String(": ") + now.join(QLatin1String(", "));
    for (const QStringList &part :
         {changes, summary.noPlugins.empty() ? QStringList()
                                             : QStringList(QStringLiteral("other files without a plug-in: %1")
                                                               .arg(summary.noPlugins.size()))})
        if (!part.isEmpty())
            text += QLatin1String("; ") + part.join(QLatin1String(", "));
    return text + QLatin1Char('\n');
}

QString channelsText(const CataloguedPlugin &plugin)
{
    const auto text = [](qint32 count) { return count < 0 ? QStringLiteral("?") : QString::number(count); };
    if (plugin.inputs < 0 && plugin.outputs < 0)
        return QStringLiteral("-");
    return text(plugin.inputs) + QLatin1Char('/') + text(plugin.outputs);
}

QString renderTable(const ScanSummary &summary, int width)
{
    return renderPlugins(summary, width) + renderFailures(summary) + renderDuplicates(summary) +
           renderProblems(summary) + renderSlowest(summary) + renderCounts(summary);
}
