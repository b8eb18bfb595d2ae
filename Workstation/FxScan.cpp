#include "Workstation/FxScan.h"

#include "Core/BaseLib/Files/SearchArea.h"
#include "Core/BaseLib/Files/TextFile.h"
#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Log/LogSink.h"
#include "Core/BaseLib/WorkstationServices/AudioPlugins.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"
#include "Main/VLib/ApplicationContext.h"
#include "Workstation/FolderCommands.h"
#include "Workstation/Library/ScanPlace.h"
#include "Workstation/ManageCommands.h"
#include "Workstation/Output/DetailText.h"
#include "Workstation/Output/SummaryOutput.h"
#include "Workstation/Output/Terminal.h"
#include "Workstation/ScanFolders.h"
#include "Workstation/ScanSession.h"
#include "Workstation/ShowCommand.h"
#include "Workstation/Summary/PluginFilter.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <algorithm>

namespace {

/// The files of fxscan's own, beside the Effects folder.
struct DataFiles {
    explicit DataFiles(const QString &dataFolder)
        : effects(dataFolder + QStringLiteral("/Effects"))
        , log(dataFolder + QStringLiteral("/FxProbe.log"))
        , report(dataFolder + QStringLiteral("/FxProbe.report"))
    {}

    QString effects;
    QString log;
    QString report;
};

using Terminal::complain;

/// Puts the variable into the environment with a file of our own, begun anew, unless the user has set it:
/// what that names is appended to.
void useFile(const char *variable, const QString &file)
{
    if (!qEnvironmentVariableIsEmpty(variable))
        return;
    qputenv(variable, QFile::encodeName(file));
    QFile::remove(file);
}

void prepareEnvironment(const ScanOptions &options, const DataFiles &files)
{
    useFile("FXPROBE_LOG", files.log);
    useFile("FXPROBE_REPORT", files.report);
    configureLogFromEnvironment();
    if (!options.showWindow)
        qputenv("QT_QPA_PLATFORM", "offscreen");
}

/// False when the result could not be written.
bool print(const ScanOptions &options, const ScanSummary &summary, const QStringList &folders)
{
    if (options.format == OutputFormat::Table && !options.show.isEmpty())
        return Terminal::print(renderDetails(summary));
    if (options.format == OutputFormat::Table)
        return Terminal::print(renderTable(summary, Terminal::outputWidth()));
    if (options.format == OutputFormat::Json)
        return Terminal::printData(QString::fromUtf8(renderJson(summary, options.dataFolder, folders)));
    if (options.format == OutputFormat::JsonLines)
        return Terminal::printData(QString::fromUtf8(renderJsonLine(summary, options.dataFolder, folders)));
    if (options.format == OutputFormat::Html)
        return Terminal::printData(QString::fromUtf8(renderHtml(summary, options.dataFolder, folders)));
    for (const QString &problem : summary.problems)
        complain(problem);
    return Terminal::printData(QString::fromUtf8(renderCsv(summary)));
}

/// Prints the result; the exit code that goes with it.
int conclude(const ScanOptions &options, ScanSummary summary, const QStringList &folders)
{
    const bool hasFailures = !summary.failures.empty(); // whether they are shown or not
    PluginFilter(options.only).apply(summary);
    if (!print(options, summary, folders)) {
        complain(QStringLiteral("the result could not be printed"));
        return ScanExit::kNotFinished;
    }
    if (!options.html.isEmpty())
        if (const FileResult written = replaceFile(
                options.html, renderHtml(summary, options.dataFolder, folders), Durability::Buffered);
            !written) {
            complain(QStringLiteral("cannot write %1: %2").arg(options.html, written.reason));
            return ScanExit::kNotFinished;
        }
    if (summary.isScan && !summary.finished)
        return ScanExit::kNotFinished;
    return options.strict && hasFailures ? ScanExit::kFailures : ScanExit::kDone;
}

int listOnly(const ScanOptions &options, const DataFiles &files)
{
    return conclude(options, summariseCatalogue(readCatalogues(files.effects), ProbeMemory(files.effects)),
                    {});
}

int show(const ScanOptions &options, const DataFiles &files)
{
    const ProbeMemory memory(files.effects);
    ScanSummary summary = summariseCatalogue(readCatalogues(files.effects), memory);
    const QStringList unknown = keepNamed(summary, options.show, memory);
    for (const QString &sentence : unknown)
        complain(sentence);
    return unknown.isEmpty() ? conclude(options, summary, {}) : ScanExit::kUsage;
}

/// Those of which something lies at or below some paths.
std::vector<Duplicate> duplicatesBelow(std::vector<Duplicate> duplicates, const QStringList &paths)
{
    const SearchArea area(paths, {});
    const auto isElsewhere = [&](const Duplicate &duplicate) {
        return std::none_of(duplicate.members.begin(), duplicate.members.end(),
                            [&](const DuplicateMember &member) { return area.isWithin(member.path); });
    };
    duplicates.erase(std::remove_if(duplicates.begin(), duplicates.end(), isElsewhere), duplicates.end());
    return duplicates;
}

int scan(const ScanOptions &options, const DataFiles &files, const ScanFolders &folders, ScanPlace &place)
{
    const HostApplication workstation(options.dataFolder, folders.listed);
    PluginHost &registry = PluginHost::instance();
    AudioPlugins::setRegistry(&registry);
    registry.initialise(options.dataFolder, QString(), PluginHost::kDefaultSampleRate,
                        PluginHost::kDefaultBlockSize);
    registry.setSearchedOnly(folders.searched);
    const CatalogueView before = onlyBelow(readCatalogues(files.effects), folders.shown);
    const QStringList searched = folders.shown.isEmpty() ? folders.listed : folders.shown;
    if (!place.writeList(workstation.scanFolders())) { // else an old one is scanned
        complain(place.reason());
        return ScanExit::kNotFinished;
    }
    if (options.asksAgain())
        if (const int failed = prepareAskAgain(options, searched, folders.shown, registry);
            failed != ScanExit::kDone)
            return failed;
    if (options.inProcess)
        ProbeReport::instance().openFromEnvironment();
    JsonLines lines(options.format == OutputFormat::JsonLines, options.only);
    lines.begin(options.dataFolder, searched);
    ScanSession session(options, registry, qEnvironmentVariable("FXPROBE_REPORT"), lines);
    const bool isFinished = session.run();
    const ProbeMemory memory(files.effects);
    const CatalogueView now = readCatalogues(files.effects);
    ScanSummary summary = summariseScan(onlyBelow(now, folders.shown), before, session.account(), memory);
    if (!folders.shown.isEmpty()) // the one that is used in place of a copy may lie elsewhere
        summary.duplicates = duplicatesBelow(findDuplicates(now.plugins, memory), folders.shown);
    summary.finished = isFinished;
    if (!isFinished)
        complain(session.reason());
    return conclude(options, summary, searched);
}

bool isScanned(const ScanOptions &options, const DataFiles &files)
{
    if (QFileInfo(files.effects).isDir())
        return true;
    complain(QStringLiteral("nothing was scanned into %1 yet").arg(options.dataFolder));
    return false;
}

/// What changes the catalogues, or what is remembered of folders, without a scan.
int edit(const ScanOptions &options, const DataFiles &files)
{
    ScanPlace place(files.effects);
    if (!place || !place.keepScannersAway()) {
        complain(place.reason());
        return ScanExit::kNotFinished;
    }
    int exitCode = options.changesMarks() ? changeMarks(options, files.effects) : ScanExit::kDone;
    if (exitCode == ScanExit::kDone && isFolderCommand(options))
        exitCode = runFolderCommand(options, files.effects);
    if (exitCode == ScanExit::kUsage)
        place.removeMade();
    return exitCode;
}

int prepareAndScan(const ScanOptions &options, const DataFiles &files)
{
    if (!options.inProcess && !QFile::exists(PluginHost::usualScannerPath())) {
        complain(QStringLiteral("there is no scanner program %1; --in-process does without")
                     .arg(PluginHost::usualScannerPath()));
        return ScanExit::kNotFinished;
    }
    ScanPlace place(files.effects);
    if (!place || (options.inProcess && !place.keepScannersAway())) {
        complain(place.reason());
        return ScanExit::kNotFinished;
    }
    const ScanFolders folders =
        foldersToScan(options, files.effects); // of the list that is nobody else's now
    for (const QString &reason : folders.leftOut)
        complain(QStringLiteral("left out: ") + reason);
    int exitCode = folders.isDamaged ? ScanExit::kNotFinished : ScanExit::kUsage;
    if (!folders.unusable.isEmpty()) {
        complain(folders.unusable);
    } else {
        prepareEnvironment(options, files);
        const QFileInfo report(qEnvironmentVariable("FXPROBE_REPORT"));
        if (report.exists() && !report.isFile())
            complain(QStringLiteral("the report %1 is not a file").arg(report.filePath()));
        else
            exitCode = scan(options, files, folders, place);
    }
    if (exitCode == ScanExit::kUsage) {
        setLogSink(FileLogSink::onStandardError()); // Windows removes no folder whose log is open
        place.removeMade();
    }
    return exitCode;
}

} // namespace

int runFxScan(const ScanOptions &options)
{
    const QFileInfo page(options.html);
    if (!options.html.isEmpty() && (page.isDir() || !page.dir().exists())) { // known before a long scan
        complain(
            (page.isDir() ? QStringLiteral("%1 is a folder") : QStringLiteral("there is no folder for %1"))
                .arg(options.html));
        return ScanExit::kUsage;
    }
    const DataFiles files(options.dataFolder);
    if (options.foldersOnly)
        return printFolders(files.effects);
    const bool isShow = !options.show.isEmpty();
    if ((options.listOnly || isShow || options.changesMarks()) && !isScanned(options, files))
        return ScanExit::kUsage;
    if (options.listOnly)
        return listOnly(options, files);
    if (isShow)
        return show(options, files);
    return options.changesMarks() || isFolderCommand(options) ? edit(options, files)
                                                              : prepareAndScan(options, files);
}
