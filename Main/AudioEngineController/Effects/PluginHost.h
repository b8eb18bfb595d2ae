#pragma once

#include "Core/BaseLib/Process/ManualResetEvent.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/Host/AudioPluginHost.h"
#include "Main/AudioEngineController/Effects/Launcher/ScannerLauncher.h"
#include "Main/AudioEngineController/Effects/ParameterHandler.h"

#include <atomic>
#include <functional>
#include <map>
#include <memory>
#include <thread>

class AudioPlugin;

/// The registry: owns one host per plug-in format and scans with all of them.
class PluginHost : public AudioPluginHost, public IntParameterHandler {
public:
    /// Sample rate in Hz and block size in samples that plug-ins are told by default.
    static constexpr int kDefaultSampleRate = 48000;
    static constexpr int kDefaultBlockSize = 1024;

    /// The process's registry, made on first use.
    static PluginHost &instance();

    PluginHost();
    ~PluginHost() override;

    /// Prepares the hosts for a data folder, given without a separator at its end. `previousEffectsFolder` is
    /// where an earlier version kept its Effects folder (empty: nowhere): its VST 2 catalogue is moved to the
    /// new Effects folder and the old folder removed, unless nothing could be moved.
    virtual void initialise(const QString &dataFolder, const QString &previousEffectsFolder, int sampleRate,
                            int blockSize);

    void ReadCatalogue() override;
    /// The folder list of the host whose list feeds the scan list.
    QStringList folders() const override;
    bool catalogueChanged() override;
    /// Reads the catalogues and lets every host scan in this process, or only refresh its lists. A scan that
    /// need not be in this process, and for which the scanner program is there, is left to the launcher: the
    /// lists are refreshed, and the launcher goes on when this returns. The completion event is set when it
    /// returns. While the launcher runs, a call does nothing. Throws std::system_error when the launcher's
    /// thread cannot be started.
    bool Scan(bool scan, bool inProcess) override;

    /// Asks a running scan to end, in this process or the scanner's; any thread. The next scan starts without
    /// the request.
    void cancelScan();
    /// Asks a launched scanner to give up on the plug-in file that it is busy with. Nobody is blamed: what is
    /// known of the file is kept, and the next scan asks it again. Any thread.
    void skipProbe(const QString &path) { m_launcher.skip(path); }
    /// True while the launcher runs scanners. It holds `m_ks` all the while.
    bool isLauncherRunning() const { return m_launching; }
    /// How the scanners of the last launch ended so far; any thread.
    std::vector<ScannerRunEnd> scannerEnds() const { return m_launcher.ends(); }
    /// Seconds after which a scanner that is busy with one plug-in is ended, so that the next run records
    /// that plug-in as disabled; 0, the default: never. Set while no launcher runs.
    void setProbeLimit(int seconds) { m_probeLimit = seconds; }
    /// How many plug-ins a scanner that is launched probes at once, each in a process of its own: 0, the
    /// default, has the machine decide; negative: one after the other in the scanner's own process. Set while
    /// no launcher runs.
    void setScanJobs(int jobs) { m_scanJobs = jobs; }
    /// MiB of resident memory that a plug-in's process may hold; 0, the default: half of the machine's memory
    /// divided by the number of jobs, at least 1 GiB. Set while no launcher runs.
    void setMemoryLimit(int mebibytes) { m_memoryLimit = mebibytes; }
    /// The files and folders that scans search, of those in the scan list; what is known of all others stays
    /// as it is. None, as at first: those that the environment variable "FXPROBE_ONLY" names, else all. Set
    /// while no launcher runs.
    void setSearchedOnly(const QStringList &paths) { m_only = paths; }
    void setAudioSettings(int sampleRate, int blockSize) override;
    void setIntParameter(IntParameter parameter, int value) override;

    /// Loads a plug-in by its identifier, whose prefix decides the host. A placeholder's gives the stand-in
    /// for the plug-in that it names. Null, with the reason in the log, when no host knows it or it cannot be
    /// loaded. Does not wait for a scan.
    std::unique_ptr<AudioPlugin> LoadPlugin(const QString &identifier);

    /// Writes the list of folders to scan. Only the workstation does; the scanner reads it.
    void WriteScanList() const;

    /// Set while no scan runs and one has run; null before the first.
    const ManualResetEvent *completionEvent() const { return m_completed.get(); }

    /// The catalogue folder of all hosts: the data folder plus "/Effects".
    const QString &effectsFolder() const { return catalogueFolder(); }
    /// The data folder plus "/Plugin Metadata".
    const QString &pluginMetadataFolder() const { return m_pluginMetadataFolder; }
    /// Where the scanner program lies unless set: beside this program.
    static QString usualScannerPath();
    /// Sets the full path of the scanner program; empty, the default: the usual one. Set while no launcher
    /// runs.
    void setScannerProgram(const QString &path) { m_scannerProgram = path; }
    /// The program that the next launch starts.
    QString scannerProgram() const;
    /// Sets environment variables that launched scanners get besides those of this process. Set while no
    /// launcher runs.
    void setScannerEnvironment(const std::map<QString, QString> &variables)
    {
        m_scannerEnvironment = variables;
    }
    /// Full path of the scanner program, known once a scan was asked for.
    const QString &scannerPath() const { return m_scannerPath; }

    /// The categories' display names in the order in which the browser shows them.
    const QStringList &sortedCategoryNames() const { return m_sortedCategoryNames; }
    /// Internal positions of the two categories that the application asks for by itself.
    int instrumentPosition() const { return m_instrumentPosition; }
    int ambisonicsPosition() const { return m_ambisonicsPosition; }

    /// The host of a format of the table.
    AudioPluginHost &host(PluginFormat format) { return *m_hosts.at(format); }

private:
    bool scanHosts(bool scan);
    void startLauncher();
    void launch();
    void reloadChanged();
    void notifyWorkstation() const;
    void moveOldCatalogue(const QString &previousEffectsFolder) const;

    void forEachHost(const std::function<void(AudioPluginHost &)> &operation) const;

    std::map<PluginFormat, std::unique_ptr<AudioPluginHost>> m_hosts; ///< one for each row of the table
    QString m_pluginMetadataFolder;
    QString m_scannerProgram; ///< empty: the usual one
    QString m_scannerPath;
    std::map<QString, QString> m_scannerEnvironment;
    std::unique_ptr<ManualResetEvent> m_completed;
    QStringList m_sortedCategoryNames;
    int m_instrumentPosition;
    int m_ambisonicsPosition;
    int m_sampleRate = kDefaultSampleRate;
    int m_blockSize = kDefaultBlockSize;
    int m_probeLimit = 0; ///< seconds
    int m_scanJobs = 0;
    int m_memoryLimit = 0; ///< MiB
    QStringList m_only;
    ScannerLauncher m_launcher;
    std::atomic<bool> m_launching{false};
    std::thread m_launcherThread; ///< joined before the next launch, and at the end
};
