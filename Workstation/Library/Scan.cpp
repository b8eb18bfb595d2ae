#include "Workstation/Library/Scan.h"

#include "Core/BaseLib/WorkstationServices/AudioPlugins.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Main/VLib/ApplicationContext.h"
#include "Workstation/Library/ScanPlace.h"
#include "Workstation/Library/ScanRun.h"
#include "Workstation/Manage/AskAgain.h"
#include "Workstation/Options/PluginFolders.h"
#include "Workstation/Summary/ScanSummary.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <thread>

namespace {

QString absolute(const QString &path) { return QDir::cleanPath(QFileInfo(path).absoluteFilePath()); }

/// Follows a scan on behalf of whoever called.
class FollowedRun : public ScanRun {
public:
    FollowedRun(const FxProbe::ScanSettings &settings, PluginHost &registry, const QString &report)
        : ScanRun(registry, report)
        , m_settings(settings)
    {}

protected:
    void wait() override
    {
        constexpr std::chrono::milliseconds kPause(50);
        std::this_thread::sleep_for(kPause);
        if (!isCancelled() && m_settings.isCancelled && m_settings.isCancelled())
            cancel();
        if (const QString path = m_settings.toSkip ? m_settings.toSkip() : QString(); !path.isEmpty())
            registry().skipProbe(absolute(path));
    }
    void show(ScanAccount &account) override
    {
        FxProbe::Progress progress;
        progress.done = account.done();
        progress.planned = account.planned();
        if (const std::vector<BegunProbe> begun = account.takeBegun(); !begun.empty())
            m_last = begun.back().key;
        if (const PluginKey *key = account.current())
            m_last = *key;
        const ProbeAccount *probe = account.find(m_last);
        progress.path = m_last.path;
        progress.name = probe && !probe->subName.isEmpty() ? probe->subName : fileNameOf(m_last.path);
        const bool isSame = progress.done == m_shown.done && progress.planned == m_shown.planned &&
                            progress.path == m_shown.path && progress.name == m_shown.name;
        if (isSame || !m_settings.progress)
            return;
        m_shown = progress;
        m_settings.progress(progress);
    }

private:
    const FxProbe::ScanSettings &m_settings;
    FxProbe::Progress m_shown;
    PluginKey m_last; ///< what was shown
};

FxProbe::Plugin describe(const CataloguedPlugin &plugin)
{
    FxProbe::Plugin described;
    described.name = plugin.record.name;
    described.vendor = plugin.record.vendor;
    described.format = QLatin1String(plugin.format->key);
    if (plugin.isUsable())
        described.identifier = QLatin1String(plugin.format->prefix) + plugin.record.id;
    described.path = plugin.record.path;
    described.subId = plugin.record.subId;
    described.categories = plugin.categories();
    described.inputs = plugin.inputs;
    described.outputs = plugin.outputs;
    described.isUsable = plugin.state() == PluginState::Ok;
    described.isFavourite = plugin.record.favourite;
    described.state = QLatin1String(stateText(plugin.state()));
    described.reason = plugin.reason;
    return described;
}

/// A file that failed and that the catalogue does not hold.
FxProbe::Plugin describe(const PluginFailure &failure)
{
    FxProbe::Plugin described;
    described.name = failure.name;
    described.format = QLatin1String(failure.format->key);
    described.path = failure.path;
    described.subId = failure.subId;
    described.state = QLatin1String(stateText(failure.state));
    described.reason = failure.reason;
    return described;
}

void fill(FxProbe::Catalogue &catalogue, const ScanSummary &summary)
{
    for (const CataloguedPlugin &plugin : summary.plugins)
        catalogue.plugins.push_back(describe(plugin));
    for (const PluginFailure &failure : summary.failures)
        if (!failure.isCatalogued)
            catalogue.plugins.push_back(describe(failure));
    catalogue.problems += summary.problems;
}

QString effectsFolderOf(const QString &dataFolder)
{
    return absolute(dataFolder) + QStringLiteral("/Effects");
}

/// The folders as they stand in the scan list. One that is not there stays: it may be on a drive that is
/// unplugged, and what is known of its plug-ins is kept.
QStringList listed(const QStringList &folders, QStringList &problems)
{
    QStringList list;
    for (const QString &given : folders) {
        const QString folder = absolute(given);
        if (!canStandInScanList(folder))
            problems.append(
                QStringLiteral("the name of the folder %1 cannot stand in a scan list").arg(folder));
        else if (!list.contains(folder))
            list.append(folder);
    }
    return list;
}

void prepare(PluginHost &registry, const FxProbe::ScanSettings &settings, const QString &report)
{
    AudioPlugins::setRegistry(&registry);
    registry.initialise(absolute(settings.dataFolder), QString(), PluginHost::kDefaultSampleRate,
                        PluginHost::kDefaultBlockSize);
    registry.setProbeLimit(settings.timeout);
    registry.setScanJobs(settings.jobs);
    registry.setMemoryLimit(settings.memoryLimit);
    QStringList only;
    for (const QString &path : settings.only)
        only += absolute(path);
    registry.setSearchedOnly(only);
    registry.setScannerProgram(settings.scannerProgram);
    std::map<QString, QString> environment{{QStringLiteral("FXPROBE_REPORT"), report}};
    if (!settings.log.isEmpty())
        environment[QStringLiteral("FXPROBE_LOG")] = settings.log;
    if (settings.isHidden)
        environment[QStringLiteral("QT_QPA_PLATFORM")] = QStringLiteral("offscreen");
    registry.setScannerEnvironment(environment);
}

/// Why what gets another chance cannot have it; empty when it can.
QString askAgain(const FxProbe::ScanSettings &settings, PluginHost &registry, const QStringList &folders)
{
    if (settings.retry.isEmpty() && !settings.retryFailed)
        return QString();
    registry.ReadCatalogue(); // absorbs the markers: the newest crash may be the one that is meant
    const AskAgainRequest request{settings.retry, settings.retryFailed};
    const AskAgainOutcome outcome = askAgain(registry.effectsFolder(), request, folders, ModuleLook());
    return !outcome.wrong.isEmpty() ? outcome.wrong.join(QStringLiteral("; ")) : outcome.written.reason;
}

} // namespace

FxProbe::ScanResult FxProbe::scan(const ScanSettings &settings)
{
    ScanResult result;
    const QStringList folders = listed(settings.folders, result.problems);
    const QString effects = effectsFolderOf(settings.dataFolder);
    PluginHost &registry = PluginHost::instance();
    const QString report = absolute(settings.dataFolder) + QStringLiteral("/FxProbe.report");
    prepare(registry, settings, report);
    if (!QFile::exists(registry.scannerProgram())) {
        result.reason = QStringLiteral("there is no scanner program %1").arg(registry.scannerProgram());
        return result;
    }
    ScanPlace place(effects);
    const HostApplication application(absolute(settings.dataFolder), folders);
    if (!place || !place.writeList(folders)) {
        result.reason = place.reason();
        return result;
    }
    QFile::remove(report);
    const CatalogueView before = readCatalogues(effects);
    FollowedRun run(settings, registry, report);
    result.reason = askAgain(settings, registry, folders);
    if (result && !run.run())
        result.reason = run.reason();
    fill(result, summariseScan(readCatalogues(effects), before, run.account(), ProbeMemory(effects)));
    return result;
}

FxProbe::Catalogue FxProbe::readCatalogue(const QString &dataFolder)
{
    Catalogue catalogue;
    const QString effects = effectsFolderOf(dataFolder);
    fill(catalogue, summariseCatalogue(readCatalogues(effects), ProbeMemory(effects)));
    return catalogue;
}
