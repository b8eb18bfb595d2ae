#include "Core/BaseLib/Files/AnswerInTime.h"
#include "Core/BaseLib/Files/SearchArea.h"
#include "Main/AudioEngineController/Effects/Protocol/FolderRules.h"
#include "Workstation/FolderCommands.h"
#include "Workstation/Options/PluginFolders.h"
#include "Workstation/Options/ScanOptions.h"
#include "Workstation/Output/Terminal.h"
#include "Workstation/ScanFolders.h"
#include "Workstation/Summary/CatalogueView.h"

#include <QFileInfo>

#include <algorithm>

namespace {

/// A folder of the list, or what is left alone in some.
struct Row {
    QString path;
    int plugins = 0;
    QString remark;
};

std::vector<Row> rowsOf(const QStringList &paths, const CatalogueView &catalogue, const QString &remark)
{
    std::vector<Row> rows;
    for (const QString &path : paths) {
        const auto lies = [&](const CataloguedPlugin &plugin) { return isBelow(plugin.record.path, path); };
        const auto &plugins = catalogue.plugins;
        rows.push_back({path, static_cast<int>(std::count_if(plugins.begin(), plugins.end(), lies)), remark});
    }
    return rows;
}

QString renderTable(const std::vector<Row> &rows)
{
    int width = Terminal::width(QStringLiteral("FOLDER"));
    for (const Row &row : rows)
        width = std::max(width, Terminal::width(Terminal::harmless(row.path)));
    QString text = Terminal::cell(QStringLiteral("FOLDER"), width) + QLatin1String("  PLUG-INS\n");
    for (const Row &row : rows) {
        QString line = Terminal::cell(Terminal::harmless(row.path), width) +
                       QStringLiteral("%1").arg(row.plugins, 10) + QLatin1String("  ") + row.remark;
        while (line.endsWith(QLatin1Char(' ')))
            line.chop(1);
        text += line + QLatin1Char('\n');
    }
    return text;
}

/// For programs.
QString renderLines(const std::vector<Row> &rows)
{
    QString text;
    for (const Row &row : rows)
        text += row.path + QLatin1Char('\t') + QString::number(row.plugins) + QLatin1Char('\t') + row.remark +
                QLatin1Char('\n');
    return text;
}

} // namespace

int printFolders(const QString &effectsFolder)
{
    const ScanFolders folders = foldersToScan(ScanOptions(), effectsFolder);
    for (const QString &reason : folders.leftOut)
        Terminal::printError(QStringLiteral("fxscan: left out: %1\n").arg(Terminal::harmless(reason)));
    if (!folders.unusable.isEmpty()) {
        Terminal::printError(QStringLiteral("fxscan: %1\n").arg(Terminal::harmless(folders.unusable)));
        return folders.isDamaged ? ScanExit::kNotFinished : ScanExit::kUsage;
    }
    const FolderRules rules = readFolderRules(effectsFolder);
    const CatalogueView catalogue = readCatalogues(effectsFolder);
    const QStringList usual = usualPluginFolders();
    std::vector<Row> rows;
    for (Row &row : rowsOf(folders.listed, catalogue, QString())) {
        if (!answers(row.path))
            row.remark = QStringLiteral("gives no answer");
        else if (!QFileInfo::exists(row.path))
            row.remark = QStringLiteral("not there");
        else if (isBelowAny(row.path, rules.excluded))
            continue; // stands below
        else if (usual.contains(row.path))
            row.remark = QStringLiteral("usual");
        rows.push_back(row);
    }
    for (const Row &row : rowsOf(rules.excluded, catalogue, QStringLiteral("excluded")))
        rows.push_back(row);
    for (const Row &row : rowsOf(rules.ignored, catalogue, QStringLiteral("ignored")))
        rows.push_back(row);
    const QString text = Terminal::outputIsTerminal() ? renderTable(rows) : renderLines(rows);
    return Terminal::printData(text) ? ScanExit::kDone : ScanExit::kNotFinished;
}
