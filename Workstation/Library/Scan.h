#pragma once

#include <QString>
#include <QStringList>

#include <functional>
#include <vector>

/// The library's face for a workstation: scans through the scanner program and reads what it left.
///
/// A `QCoreApplication` must exist. Nothing here throws but what the callbacks throw and what the system's
/// want of memory or threads does. One scan at a time in a process; other functions may run on any thread.
namespace FxProbe {

/// One plug-in of the catalogue, or a file that was taken for one and cannot be used.
struct Plugin {
    QString name;   ///< display name
    QString vendor; ///< as the plug-in states it; may be empty
    QString format; ///< "vst3", "vst2" or "clap", the key of `PluginFormatInfo`
    /// With the prefix of its format ("vst3:"); tells it from all others. Empty where the plug-in
    /// cannot be used.
    QString identifier;
    QString path;             ///< full path of the module's file, with "/"
    quint32 subId = 0;        ///< identifier of a sub-plug-in in the shell at `path`; 0: it is not one
    QStringList categories;   ///< display names
    int inputs = -1;          ///< audio channels; -1: unknown
    int outputs = -1;         ///< audio channels; -1: unknown
    bool isUsable = false;    ///< it works, and the user did not switch it off
    bool isFavourite = false; ///< the user's mark
    /// "ok", "failed", "disabled" (it ended its scanner or gave no answer), "switched off" or "ignored" (by
    /// the user), "folder away" (its folder is not there or is empty), "file gone" (its folder is there, it
    /// is not), or, only in what a scan came to, "skipped" (by the user, and nothing is known of it)
    QString state;
    QString reason; ///< why it cannot be used: one phrase without a full stop; empty when it can
};

/// How far a scan got.
struct Progress {
    int done = 0;    ///< files dealt with
    int planned = 0; ///< files to deal with; 0 until the folders were searched, and it grows with each format
    QString path;    ///< the file that has been at work for the longest; when none is, the last one
    QString name;    ///< name of that file, or of the sub-plug-in in it
};

/// What a scan does.
struct ScanSettings {
    /// Folder of the application's data; the catalogues are kept in its folder "Effects". Made where it is
    /// not there. It belongs to the library: keep nothing else in "Effects".
    QString dataFolder;
    /// All folders to search, with those below them. What is known of plug-ins in a folder that is not given
    /// any more is dropped; in one that is given and not there, as on a drive that is unplugged, it is kept.
    QStringList folders;
    /// Folders in those, and paths of plug-ins, that alone are searched; what is known of all others stays as
    /// it is. None: all are searched.
    QStringList only;
    /// Plug-ins that are disabled or failed and get another chance in this scan: paths of their files, or
    /// their names. What the user switched off stays so. A name that means none, or several, ends the scan.
    QStringList retry;
    bool retryFailed = false; ///< all of them
    /// Full path of the scanner program; empty: "FxProbe" beside this program.
    QString scannerProgram;
    int timeout = 60;     ///< seconds that one plug-in may take; 0: for ever
    int jobs = 0;         ///< plug-ins probed at once, each in a process of its own; 0: as suits the machine
    int memoryLimit = 0;  ///< MiB that a plug-in's process may take; 0: a share of the machine's memory
    bool isHidden = true; ///< false: the scanner shows its window with the progress
    QString log;          ///< file to which the scanner's log is appended; empty: there is none
    /// Called on the scan's thread whenever the progress has changed, at most twenty times a second.
    std::function<void(const Progress &)> progress;
    /// Asked on the scan's thread twenty times a second; true ends the scan within seconds. Nobody is blamed
    /// for a scan that was cancelled, and what was found is kept.
    std::function<bool()> isCancelled;
    /// Asked on the scan's thread twenty times a second for the path of a file to pass over, `Progress::path`
    /// for example; empty: none. The scan gives up on it, now or when its turn comes. It is not blamed: what
    /// is known of it stays, and the next scan asks it again.
    std::function<QString()> toSkip;
};

/// What the catalogue holds.
struct Catalogue {
    std::vector<Plugin> plugins; ///< by name, then path
    QStringList
        problems; ///< one sentence each: folders that are not there, files that cannot be read or written
};

/// What a scan came to.
struct ScanResult : Catalogue {
    QString reason; ///< why the scan did not come to its end: one sentence; empty: it did
    /// True when the scan came to its end, whatever it found.
    explicit operator bool() const { return reason.isEmpty(); }
};

/// Scans, and returns when the scan is over: call it on a thread that may wait. Plug-ins are never loaded
/// into this process. Plug-ins that did not change since the last scan are not loaded again; one that ends
/// its scanner, hangs or takes too much memory is recorded as disabled, and the scan goes on.
ScanResult scan(const ScanSettings &settings);

/// Reads the catalogue as the last scan left it; changes nothing. Empty where nothing was scanned yet.
Catalogue readCatalogue(const QString &dataFolder);

} // namespace FxProbe
