#include "Main/AudioEngineController/Effects/PluginHost.h"

#include "Core/BaseLib/Files/FileFinder.h"
#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/ProcessSetup.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPHost.h"
#include "Main/AudioEngineController/Effects/Catalogue/CategoryTable.h"
#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"
#include "Main/AudioEngineController/Effects/Host/AudioUnitHost.h"
#include "Main/AudioEngineController/Effects/Host/MRLAudioPluginHost.h"
#include "Main/AudioEngineController/Effects/Host/ProbePool.h"
#include "Main/AudioEngineController/Effects/Protocol/FolderRules.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Host.h"
#include "Main/VLib/ApplicationContext.h"
#include "Main/VLib/SimpleGUI.h"

#include <QCoreApplication>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QThread>

namespace {

#ifdef _WIN32
constexpr char kScannerProgram[] = "/FxProbe.exe";
#else
constexpr char kScannerProgram[] = "/FxProbe";
#endif

/// The host column of the table of formats.
std::unique_ptr<AudioPluginHost> makeHost(PluginFormat format)
{
    switch (format) {
    case PluginFormat::Vst2:
        return std::make_unique<VSTHost>();
    case PluginFormat::Vst3:
        return std::make_unique<VST3Host>();
    case PluginFormat::Clap:
        return std::make_unique<CLAPHost>();
    case PluginFormat::BuiltIn:
        return std::make_unique<MRLAudioPluginHost>();
    case PluginFormat::AudioUnit:
    case PluginFormat::Unknown:
        break;
    }
    return std::make_unique<AudioUnitHost>();
}

IQuillonInterface *application() { return ApplicationContext::instance().quillonInterface; }

/// Plug-ins mostly wait: four for each core get through most of them soonest, see docs/performance.md.
int scanJobs(int wanted)
{
    constexpr int kMost = 8;
    const int ofMachine = std::min(kMost, 4 * std::max(1, QThread::idealThreadCount()));
    return wanted == 0 ? ofMachine : std::max(wanted, 0);
}

int memoryLimit(int wanted, int jobs)
{
    constexpr qint64 kLeast = 1024; // MiB
    const qint64 share = machineMemory() / (1 << 20) / 2 / std::max(jobs, 1);
    return wanted > 0 ? wanted : static_cast<int>(std::max(kLeast, share));
}

/// The program that runs, also where its file was replaced meanwhile.
QString thisProgram()
{
#ifdef __linux__
    return QStringLiteral("/proc/self/exe");
#else
    return QCoreApplication::applicationFilePath();
#endif
}

/// The workers that whoever started this process asked for; null when nobody did.
std::shared_ptr<ProbePool> poolOfEnvironment()
{
    constexpr int kMost = 64;
    const int jobs = std::min(kMost, qEnvironmentVariableIntValue("FXPROBE_JOBS"));
    if (jobs <= 0 || !application() || !application()->isScanner())
        return nullptr;
    return std::make_shared<ProbePool>(ProbePool::Settings{
        thisProgram(), jobs, std::chrono::seconds(qEnvironmentVariableIntValue("FXPROBE_PROBE_LIMIT")),
        qint64(qEnvironmentVariableIntValue("FXPROBE_MEMORY_LIMIT")) << 20});
}

bool isSameOrInside(const QString &folder, const QString &outer)
{
    const QString inside = QFileInfo(folder).canonicalFilePath() + QLatin1Char('/');
    return inside.startsWith(QFileInfo(outer).canonicalFilePath() + QLatin1Char('/'), kPathCase);
}

} // namespace

PluginHost &PluginHost::instance()
{
    static PluginHost registry;
    return registry;
}

PluginHost::PluginHost()
    : m_sortedCategoryNames(CategoryTable::instance().sortedNames())
    , m_instrumentPosition(CategoryTable::instance().instrumentPosition())
    , m_ambisonicsPosition(CategoryTable::instance().ambisonicsPosition())
{
    for (const PluginFormatInfo &info : pluginFormats())
        m_hosts.emplace(info.format, makeHost(info.format));
}

PluginHost::~PluginHost()
{
    m_launcher.cancel();
    if (m_launcherThread.joinable())
        m_launcherThread.join();
}

/// In the order in which formats are scanned.
void PluginHost::forEachHost(const std::function<void(AudioPluginHost &)> &operation) const
{
    for (const PluginFormatInfo &info : pluginFormats())
        operation(*m_hosts.at(info.format));
}

void PluginHost::initialise(const QString &dataFolder, const QString &previousEffectsFolder, int sampleRate,
                            int blockSize)
{
    // Absolute: a plug-in may change the working folder while its marker must be found.
    setCatalogueFolder(QFileInfo(dataFolder + QStringLiteral("/Effects")).absoluteFilePath());
    m_pluginMetadataFolder = dataFolder + QStringLiteral("/Plugin Metadata");
    forEachHost([this](AudioPluginHost &host) { host.setCatalogueFolder(effectsFolder()); });
    setAudioSettings(sampleRate, blockSize);
    if (!previousEffectsFolder.isEmpty())
        moveOldCatalogue(previousEffectsFolder);
}

void PluginHost::moveOldCatalogue(const QString &previousEffectsFolder) const
{
    const QString file = QString::fromLatin1(vstCatalogueFormat().fileName);
    const QString old = previousEffectsFolder + file;
    if (!QFile::exists(old))
        return;
    QDir().mkpath(effectsFolder());
    // The old folder goes with all its content, but never with the new one inside. Asked now: a system that
    // tells no case apart moves a file onto itself.
    const bool isNeeded = isSameOrInside(effectsFolder(), previousEffectsFolder);
    QFile source(old);
    if (!source.rename(effectsFolder() + file)) {
        DebugLog(L"Cannot move %ls to %ls: %ls", old, effectsFolder(), source.errorString());
        return;
    }
    if (!isNeeded)
        QDir(previousEffectsFolder).removeRecursively();
}

void PluginHost::ReadCatalogue()
{
    forEachHost([](AudioPluginHost &host) { host.ReadCatalogue(); });
}

QStringList PluginHost::folders() const { return m_hosts.at(PluginFormat::Vst2)->folders(); }

bool PluginHost::catalogueChanged()
{
    bool changed = false;
    forEachHost([&](AudioPluginHost &host) { changed |= host.catalogueChanged(); });
    return changed;
}

void PluginHost::setAudioSettings(int sampleRate, int blockSize)
{
    m_sampleRate = sampleRate;
    m_blockSize = blockSize;
    forEachHost([=](AudioPluginHost &host) { host.setAudioSettings(sampleRate, blockSize); });
}

void PluginHost::setIntParameter(IntParameter parameter, int value)
{
    const bool isRate = parameter == IntParameter::SampleRate;
    setAudioSettings(isRate ? value : m_sampleRate, isRate ? m_blockSize : value);
}

void PluginHost::WriteScanList() const
{
    if (application() && application()->isScanner())
        return;
    const QString path = effectsFolder() + QLatin1String(kScanListFile);
    if (const FileResult written = ::WriteScanList(path, folders()); !written)
        DebugLog(L"Cannot write the scan list %ls: %ls", path, written.reason);
}

QString PluginHost::usualScannerPath()
{
    return QCoreApplication::applicationDirPath() + QLatin1String(kScannerProgram);
}

QString PluginHost::scannerProgram() const
{
    return m_scannerProgram.isEmpty() ? usualScannerPath() : m_scannerProgram;
}

void PluginHost::notifyWorkstation() const
{
    if (application())
        application()->pluginListsChanged();
}

bool PluginHost::Scan(bool scan, bool inProcess)
{
    if (m_launching)
        return false;
    if (!m_completed)
        m_completed = std::make_unique<ManualResetEvent>();
    m_completed->reset();
    m_launcher.reset();
    forEachHost([](AudioPluginHost &host) { host.clearCancel(); });
    FileFinder::forgetReports();
    ReadCatalogue();
    m_scannerPath = scannerProgram();
    WriteScanList();
    const bool isLaunched = scan && !inProcess && QFile::exists(m_scannerPath);
    const bool written = scanHosts(scan && !isLaunched);
    if (scan)
        notifyWorkstation();
    if (isLaunched)
        startLauncher();
    DebugLog(L"Plugin Scan Complete");
    showStatus(L"Plugin Scan Complete");
    m_completed->set();
    return written;
}

bool PluginHost::scanHosts(bool scan)
{
    bool written = false;
    QStringList endings;
    for (const PluginFormatInfo &info : pluginFormats())
        if (info.isScanned())
            endings.append(info.moduleEnding);
    const auto finder = std::make_shared<FileFinder>(endings, FileFinder::Links::Followed, isPartOfBundle);
    if (scan) {
        finder->setArea(
            {m_only.isEmpty() ? searchedOnly() : m_only, readFolderRules(effectsFolder()).excluded});
        finder->setPatience(std::chrono::seconds(m_probeLimit > 0
                                                     ? m_probeLimit
                                                     : qEnvironmentVariableIntValue("FXPROBE_PROBE_LIMIT")),
                            [](const QString &folder) { ProbeReport::instance().looking(folder); });
    }
    const std::shared_ptr<ProbePool> pool = scan ? poolOfEnvironment() : nullptr;
    const auto memory = std::make_shared<ProbeMemory>(effectsFolder());
    forEachHost([&](AudioPluginHost &host) {
        host.setFileFinder(finder);
        host.setProbePool(pool);
        host.setProbeMemory(memory);
    });
    for (const PluginFormatInfo &info : pluginFormats())
        if (pool && info.isScanned())
            m_hosts.at(info.format)->prepareScan();
    forEachHost([&](AudioPluginHost &host) {
        if (scan && !pool && m_launcher.isCancelled()) // what the host knows stays in its catalogue
            ProbeReport::instance().cancelled();
        else
            written |= host.Scan(scan, true);
        host.setFileFinder(nullptr);
        host.setProbePool(nullptr);
        host.setProbeMemory(nullptr);
    });
    if (scan)
        forEachHost([](AudioPluginHost &host) { host.scansEnded(); });
    return written;
}

void PluginHost::cancelScan()
{
    m_launcher.cancel();
    forEachHost([](AudioPluginHost &host) { host.cancel(); });
}

void PluginHost::startLauncher()
{
    if (m_launcherThread.joinable())
        m_launcherThread.join(); // of an earlier launch, which has ended
    m_launching = true;
    try {
        m_launcherThread = std::thread([this] { launch(); });
    } catch (...) {
        m_launching = false;
        m_completed->set();
        throw;
    }
}

/// The launcher thread.
void PluginHost::launch()
{
    const TAutoLockCS lock(&m_ks);
    try {
        const int jobs = scanJobs(m_scanJobs);
        std::map<QString, QString> environment = m_scannerEnvironment;
        if (!m_only.isEmpty())
            environment[QStringLiteral("FXPROBE_ONLY")] = searchedOnlyText(m_only);
        m_launcher.run({m_scannerPath, effectsFolder() + QLatin1String(kScanListFile), effectsFolder(),
                        m_probeLimit, [this] { WriteScanList(); }, jobs, memoryLimit(m_memoryLimit, jobs),
                        environment});
        if (!m_launcher.isCancelled())
            reloadChanged();
    } catch (const std::exception &error) {
        DebugLog(L"The scanner's launcher ended early: %s", error.what());
    }
    m_launching = false;
}

void PluginHost::reloadChanged()
{
    bool changed = false;
    forEachHost([&](AudioPluginHost &host) {
        if (!host.catalogueChanged())
            return;
        host.ReadCatalogue();
        host.Scan(false, true);
        changed = true;
    });
    if (changed)
        notifyWorkstation();
}
