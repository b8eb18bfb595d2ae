#include "Workstation/FxScan.h"

#include "Core/BaseLib/AudioPlugins.h"
#include "Core/BaseLib/DebugLog.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Main/AudioEngineController/Effects/ProbeReport.h"
#include "Main/AudioEngineController/Effects/ScanList.h"
#include "Main/AudioEngineController/Effects/ScanLock.h"
#include "Workstation/PluginFolders.h"
#include "Workstation/Retry.h"
#include "Workstation/ScanSession.h"
#include "Workstation/SummaryOutput.h"
#include "Workstation/Terminal.h"
#include "Workstation/WorkstationInterface.h"

#include <QDir>
#include <QFile>

namespace {

/// The files of fxscan's own, beside the Effects folder.
struct DataFiles {
    explicit DataFiles(const QString &dataFolder)
        : effects(dataFolder + QStringLiteral("/Effects"))
        , log(dataFolder + QStringLiteral("/FxProbe.log"))
        , report(dataFolder + QStringLiteral("/FxProbe.report"))
        , reasons(dataFolder + QStringLiteral("/fxscan-reasons.json"))
    {}

    QString effects;
    QString log;
    QString report;
    QString reasons;
};

void complain(const QString &text)
{
    Terminal::printError(QStringLiteral("fxscan: %1\n").arg(Terminal::harmless(text)));
}

/// Puts the variable into the environment, unless the user has set it, and empties the file it names.
void useFile(const char *variable, const QString &file)
{
    if (qEnvironmentVariableIsEmpty(variable))
        qputenv(variable, QFile::encodeName(file));
    QFile::remove(qEnvironmentVariable(variable));
}

void prepareEnvironment(const ScanOptions &options, const DataFiles &files)
{
    if (qEnvironmentVariableIsEmpty("FXPROBE_LOG")) // a log of the user's own goes on
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
    if (options.folders.isEmpty() && options.isRetry())
        if (const QStringList last =
                settleFolders(ReadScanList(files.effects + QLatin1String(kScanListFile))).folders;
            !last.isEmpty())
            return last;
    if (options.folders.isEmpty())
        return existingUsualFolders();
    const SettledFolders settled = settleFolders(options.folders);
    for (const QString &reason : settled.leftOut)
        complain(QStringLiteral("left out: ") + reason);
    return settled.folders;
}

void print(const ScanOptions &options, const ScanSummary &summary, const QStringList &folders)
{
    switch (options.format) {
    case OutputFormat::Table:
        Terminal::print(renderTable(summary));
        return;
    case OutputFormat::Json:
        Terminal::print(QString::fromUtf8(renderJson(summary, options.dataFolder, folders)));
        return;
    case OutputFormat::Csv:
        Terminal::print(QString::fromUtf8(renderCsv(summary)));
        return;
    }
}

int exitCode(const ScanOptions &options, const ScanSummary &summary)
{
    if (summary.isScan && !summary.finished)
        return ScanExit::kNotFinished;
    return options.strict && !summary.failures.empty() ? ScanExit::kFailures : ScanExit::kDone;
}

int listOnly(const ScanOptions &options, const DataFiles &files)
{
    const ScanSummary summary = summariseCatalogue(readCatalogues(files.effects), ReasonStore(files.reasons));
    print(options, summary, {});
    return exitCode(options, summary);
}

/// Gives plug-ins another chance; false when the command makes no sense.
bool retry(const ScanOptions &options, PluginHost &registry, const DataFiles &files)
{
    registry.ReadCatalogue(); // absorbs the markers: the newest crash may be the one that is meant
    const RetryOutcome outcome = retryPlugins(files.effects, options.retry);
    for (const QString &name : outcome.unknown)
        complain(QStringLiteral("no plug-in '%1' is disabled or failed").arg(name));
    if (!outcome.written)
        complain(QStringLiteral("cannot write ") + outcome.written.reason);
    return outcome.unknown.isEmpty() && outcome.written;
}

int scan(const ScanOptions &options, const DataFiles &files, const QStringList &folders)
{
    const WorkstationInterface workstation(options.dataFolder, folders);
    PluginHost &registry = PluginHost::instance();
    AudioPlugins::setRegistry(&registry);
    registry.initialise(options.dataFolder, QString(), PluginHost::kDefaultSampleRate,
                        PluginHost::kDefaultBlockSize);
    const CatalogueView before = readCatalogues(files.effects);
    if (options.isRetry() && !retry(options, registry, files))
        return ScanExit::kUsage;
    if (options.inProcess)
        ProbeReport::instance().openFromEnvironment();
    ScanSession session(options, registry, qEnvironmentVariable("FXPROBE_REPORT"));
    const bool isFinished = session.run();
    ScanSummary summary =
        summariseScan(readCatalogues(files.effects), before, session.account(), ReasonStore(files.reasons));
    summary.finished = isFinished;
    if (const FileResult kept = reasonsToRemember(summary).write(files.reasons); !kept)
        DebugLog(L"Cannot write %ls: %ls", files.reasons, kept.reason);
    print(options, summary, folders);
    if (!isFinished)
        complain(session.reason());
    return exitCode(options, summary);
}

} // namespace

int runFxScan(ScanOptions options)
{
    const DataFiles files(options.dataFolder);
    if (options.listOnly)
        return listOnly(options, files);
    if (!QDir().mkpath(files.effects)) {
        complain(QStringLiteral("cannot make the folder %1").arg(files.effects));
        return ScanExit::kNotFinished;
    }
    const QStringList folders = foldersToScan(options, files);
    if (folders.isEmpty()) {
        complain(options.folders.isEmpty()
                     ? QStringLiteral("none of the usual plug-in folders exists; name one")
                     : QStringLiteral("none of the folders given can be scanned"));
        return ScanExit::kUsage;
    }
    if (!options.inProcess && !QFile::exists(PluginHost::usualScannerPath())) {
        complain(QStringLiteral("there is no scanner program %1; scanning in this process")
                     .arg(PluginHost::usualScannerPath()));
        options.inProcess = true;
    }
    const ScanLock lock(files.effects,
                        options.inProcess ? ScanLock::Role::Scanner : ScanLock::Role::Workstation);
    if (lock.isHeldByOther()) {
        complain(QStringLiteral("another scan is at work on %1").arg(files.effects));
        return ScanExit::kNotFinished;
    }
    prepareEnvironment(options, files);
    return scan(options, files, folders);
}
