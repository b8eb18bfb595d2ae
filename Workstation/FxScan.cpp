#include "Workstation/FxScan.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/WorkstationServices/AudioPlugins.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"
#include "Main/VLib/ApplicationContext.h"
#include "Workstation/Forget.h"
#include "Workstation/Library/ScanPlace.h"
#include "Workstation/ManageCommands.h"
#include "Workstation/Options/PluginFolders.h"
#include "Workstation/Output/SummaryOutput.h"
#include "Workstation/Output/Terminal.h"
#include "Workstation/ScanSession.h"

#include <QFile>
#include <QFileInfo>

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

/// The folders to scan; with none given and a retry asked for, those of the last scan: what they held stays
/// listed.
QStringList foldersToScan(const ScanOptions &options, const DataFiles &files)
{
    if (options.folders.isEmpty() && options.asksAgain())
        if (const QStringList last =
                settleFolders(ReadScanList(files.effects + QLatin1String(kScanListFile)).folders).folders;
            !last.isEmpty())
            return last;
    if (options.folders.isEmpty())
        for (const QString &reason : settleFolders(foldersOfEnvironment()).leftOut)
            complain(QStringLiteral("left out: ") + reason);
    if (options.folders.isEmpty())
        return existingUsualFolders();
    const SettledFolders settled = settleFolders(options.folders);
    for (const QString &reason : settled.leftOut)
        complain(QStringLiteral("left out: ") + reason);
    return settled.folders;
}

/// False when the result could not be written.
bool print(const ScanOptions &options, const ScanSummary &summary, const QStringList &folders)
{
    if (options.format == OutputFormat::Table)
        return Terminal::print(renderTable(summary));
    if (options.format == OutputFormat::Json)
        return Terminal::printData(QString::fromUtf8(renderJson(summary, options.dataFolder, folders)));
    if (options.format == OutputFormat::JsonLines)
        return Terminal::printData(QString::fromUtf8(renderJsonLine(summary, options.dataFolder, folders)));
    for (const QString &problem : summary.problems)
        complain(problem);
    return Terminal::printData(QString::fromUtf8(renderCsv(summary)));
}

/// Prints the result; the exit code that goes with it.
int conclude(const ScanOptions &options, const ScanSummary &summary, const QStringList &folders)
{
    if (!print(options, summary, folders)) {
        complain(QStringLiteral("the result could not be printed"));
        return ScanExit::kNotFinished;
    }
    if (summary.isScan && !summary.finished)
        return ScanExit::kNotFinished;
    return options.strict && !summary.failures.empty() ? ScanExit::kFailures : ScanExit::kDone;
}

int listOnly(const ScanOptions &options, const DataFiles &files)
{
    return conclude(options, summariseCatalogue(readCatalogues(files.effects), ProbeMemory(files.effects)),
                    {});
}

int printUsualFolders()
{
    QString lines;
    for (const QString &folder : existingUsualFolders())
        lines += folder + QLatin1Char('\n');
    return Terminal::printData(lines) ? ScanExit::kDone : ScanExit::kNotFinished;
}

int forget(const ScanOptions &options, const DataFiles &files)
{
    const ForgetOutcome outcome = forgetFolder(files.effects, options.forget);
    if (!outcome.written)
        complain(QStringLiteral("cannot write ") + outcome.written.reason);
    Terminal::print(QStringLiteral("%1 plug-in%2 dropped\n")
                        .arg(outcome.records)
                        .arg(QLatin1String(outcome.records == 1 ? "" : "s")));
    return outcome.written ? ScanExit::kDone : ScanExit::kNotFinished;
}

int scan(const ScanOptions &options, const DataFiles &files, const QStringList &folders, ScanPlace &place)
{
    const HostApplication workstation(options.dataFolder, folders);
    PluginHost &registry = PluginHost::instance();
    AudioPlugins::setRegistry(&registry);
    registry.initialise(options.dataFolder, QString(), PluginHost::kDefaultSampleRate,
                        PluginHost::kDefaultBlockSize);
    const CatalogueView before = readCatalogues(files.effects);
    if (!place.writeList(workstation.scanFolders())) { // else an old one is scanned
        complain(place.reason());
        return ScanExit::kNotFinished;
    }
    if (options.asksAgain())
        if (const int failed = prepareAskAgain(options, folders, registry); failed != ScanExit::kDone)
            return failed;
    if (options.inProcess)
        ProbeReport::instance().openFromEnvironment();
    JsonLines lines(options.format == OutputFormat::JsonLines);
    lines.begin(options.dataFolder, folders);
    ScanSession session(options, registry, qEnvironmentVariable("FXPROBE_REPORT"), lines);
    const bool isFinished = session.run();
    ScanSummary summary =
        summariseScan(readCatalogues(files.effects), before, session.account(), ProbeMemory(files.effects));
    summary.finished = isFinished;
    if (!isFinished)
        complain(session.reason());
    return conclude(options, summary, folders);
}

bool isScanned(const ScanOptions &options, const DataFiles &files)
{
    if (QFileInfo(files.effects).isDir())
        return true;
    complain(QStringLiteral("nothing was scanned into %1 yet").arg(options.dataFolder));
    return false;
}

/// What changes the catalogues without a scan.
int edit(const ScanOptions &options, const DataFiles &files)
{
    ScanPlace place(files.effects);
    if (!place || !place.keepScannersAway()) {
        complain(place.reason());
        return ScanExit::kNotFinished;
    }
    return options.changesMarks() ? changeMarks(options, files.effects) : forget(options, files);
}

int prepareAndScan(const ScanOptions &options, const DataFiles &files)
{
    const QStringList folders = foldersToScan(options, files);
    if (folders.isEmpty()) {
        complain(options.folders.isEmpty()
                     ? QStringLiteral("none of the usual plug-in folders exists; name one")
                     : QStringLiteral("none of the folders given can be scanned"));
        return ScanExit::kUsage;
    }
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
    prepareEnvironment(options, files);
    if (const QFileInfo report(qEnvironmentVariable("FXPROBE_REPORT")); report.exists() && !report.isFile()) {
        complain(QStringLiteral("the report %1 is not a file").arg(report.filePath()));
        return ScanExit::kUsage;
    }
    return scan(options, files, folders, place);
}

} // namespace

int runFxScan(const ScanOptions &options)
{
    if (options.foldersOnly)
        return printUsualFolders();
    const DataFiles files(options.dataFolder);
    const bool isEdit = options.changesMarks() || !options.forget.isEmpty();
    if ((isEdit || options.listOnly) && !isScanned(options, files))
        return ScanExit::kUsage;
    if (options.listOnly)
        return listOnly(options, files);
    return isEdit ? edit(options, files) : prepareAndScan(options, files);
}
