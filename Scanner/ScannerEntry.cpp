#include "Scanner/ScannerEntry.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/PluginThread.h"
#include "Core/BaseLib/Process/ProcessSetup.h"
#include "Core/BaseLib/Process/TerminationRequest.h"
#include "Core/BaseLib/WorkstationServices/AudioPlugins.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"
#include "Main/AudioEngineController/Effects/Protocol/FolderRules.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanLock.h"
#include "Main/ReWire/ReWireProbe.h"
#include "Main/VLib/UiFxProbe.h"
#include "Scanner/QuillonInterfaceImpl.h"

#include <QApplication>
#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <cstdio>

namespace {

/// Where the workstation keeps its scan list, below the user's home folder.
constexpr char kDefaultScanList[] =
    "/AppData/Roaming/Morrow Labs/Quillon/Preferences/Tessel/Effects/FXScan.xml";
/// The exit code for a scan list, or folder rules, that are there and cannot be used.
constexpr int kUnusableList = 2;
constexpr char kReWireArgument[] = "-rewire_version";
/// How long a plug-in may go on after somebody asked the process to end.
constexpr std::chrono::seconds kTerminationGrace(2);
/// The same with workers: the scan ends them by itself, and writes what there is.
constexpr std::chrono::seconds kGraceWithWorkers(3);

int reportReWireVersion()
{
    const int verdict = probeReWireVersion();
    std::fputs(verdict == 0 ? "INSTALLED REWIRE VERSION OK\n" : "REWIRE VERSION UPDATE REQUIRED\n", stdout);
    std::fflush(stdout);
    return verdict;
}

/// The scan itself; runs on the dialog's worker thread.
void scanEverything(const QString &dataFolder)
{
    const PluginThread thread;
    PluginHost &registry = PluginHost::instance();
    AudioPlugins::setRegistry(&registry);
    registry.initialise(dataFolder, QString(), PluginHost::kDefaultSampleRate, PluginHost::kDefaultBlockSize);
    registry.Scan(true, true);
    ProbeReport::instance().finish();
}

void runDialog(QApplication &application, const QString &dataFolder, bool isDefaultPath)
{
    // Outlives the dialog, whose destructor waits for the plug-in at hand.
    const TerminationWatcher watcher(
        [&application] {
            QMetaObject::invokeMethod(&application, &QApplication::quit, Qt::QueuedConnection);
        },
        [] { CrashMarker::abandonAll([] { leaveProcess(0); }); },
        qEnvironmentVariableIntValue("FXPROBE_JOBS") > 0 ? kGraceWithWorkers : kTerminationGrace);
    QObject::connect(
        &application, &QGuiApplication::commitDataRequest, &application,
        [](QSessionManager &) { TerminationSignal::raise(); }, Qt::DirectConnection);
    UiFxProbe dialog(dataFolder, scanEverything);
    dialog.run(application, isDefaultPath);
    if (dialog.hasLostThread())
        leaveProcess(0);
}

/// Says that a file which tells what to scan, and what not, cannot be used; the exit code.
int refuse(const QString &file, const QString &reason)
{
    DebugLog(L"%ls cannot be used, so nothing is scanned: %ls", file, reason);
    ProbeReport::instance().unreadList(file, reason);
    ProbeReport::instance().finish();
    return kUnusableList;
}

} // namespace

int runScanner(QApplication &application)
{
    const QStringList arguments = application.arguments();
    const bool isDefaultPath = arguments.size() < 2;
    const QString given =
        isDefaultPath ? QDir::homePath() + QLatin1String(kDefaultScanList) : arguments.at(1);
    if (given == QLatin1String(kReWireArgument))
        return reportReWireVersion();
    if (!QFile::exists(given))
        return 0;
    // The data folder is a part of it, which a path from the working folder need not have.
    const QString path = QDir::isAbsolutePath(given) ? given : QFileInfo(given).absoluteFilePath();
    const QString dataFolder = dataFolderOf(path);
    ProbeReport::instance().openFromEnvironment();
    const ScanLock lock(dataFolder + QStringLiteral("/Effects"));
    if (lock.isHeldByOther()) {
        DebugLog(L"Another scanner is at work for %ls", dataFolder);
        ProbeReport::instance().busy();
        return 0;
    }
    const ScanListContents list = ReadScanList(path);
    if (!list)
        return refuse(path, list.reason);
    if (const FolderRules rules = readFolderRules(dataFolder + QStringLiteral("/Effects")); !rules)
        return refuse(dataFolder + QStringLiteral("/Effects") + QLatin1String(kFolderRulesFile),
                      rules.reason);
    const QuillonInterfaceImpl workstation(dataFolder, list.folders);
    runDialog(application, dataFolder, isDefaultPath);
    return 0;
}
