#pragma once

#include "Core/BaseLib/Files/TextFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <QStringList>

#include <functional>
#include <vector>

/// A crash marker on disk: a small file that names the plug-in being probed. One that survives its process
/// names the culprit. The object owns the file, which goes with it.
class CrashMarker {
public:
    /// Owns no marker.
    CrashMarker() = default;
    /// Writes the marker of a plug-in (path, file time, sub-plug-in identifier) into a catalogue folder. A
    /// null name is made from the path. The file bears the name, with what a file system does not take
    /// replaced, cut where it is too long; where it is taken by a marker of this process or by one of
    /// `taken`, a sub-plug-in's gets its identifier behind, any other a number in front. A marker that cannot
    /// be written is logged: the plug-in is probed unprotected. A suspect's marker blames nobody: it says
    /// that the plug-in was being probed when the scanner ended, which asked others at the same time.
    CrashMarker(const MarkerFormat &format, const QString &folder, EffectRecord plugin,
                const QString &name = QString(), const QStringList &taken = {}, bool isSuspect = false);
    /// Deletes the file; one that stays would name a culprit to the next run, and is logged.
    ~CrashMarker();
    CrashMarker(CrashMarker &&other) noexcept;
    CrashMarker &operator=(CrashMarker &&other) noexcept;
    CrashMarker(const CrashMarker &) = delete;
    CrashMarker &operator=(const CrashMarker &) = delete;

    /// The file's full path; empty when there is none.
    const QString &path() const { return m_path; }
    /// Renews the file's time stamp: whoever watches for a hanging probe sees that it goes on.
    void refresh() const;
    /// Deletes the file now.
    void remove();
    /// Leaves the file to the next run.
    void leave();

    /// When a plug-in is being probed: deletes the markers of this process, so that nobody is blamed, and
    /// calls `then` while no new marker can appear. Any thread.
    static void abandonAll(const std::function<void()> &then);

private:
    QString m_path;
};

/// A marker that was found, with what it says: a record that is not enabled. One that is damaged has empty
/// fields.
struct FoundMarker {
    QString file;
    PluginFormat format;
    EffectRecord plugin;
    bool isSuspect; ///< it names one of several that were being probed at once: no culprit, but asked first
};

/// Reads a marker of a format. The file stays: it is deleted once the catalogue holds what it said.
EffectRecord readMarkerFile(const MarkerFormat &format, const QString &marker);
/// The format that a marker's file name belongs to; null for another file.
const PluginFormatInfo *formatOfMarker(const QString &file);
/// The patterns of the markers' file names, of all formats.
QStringList markerPatterns();
/// Reads the markers of these files, all formats.
std::vector<FoundMarker> readMarkers(const QStringList &files);
/// Whether a marker among others names no culprit: it names a suspect only, or that of a whole shell is there
/// beside its child's, and the child is the culprit.
bool isExcused(const FoundMarker &marker, const std::vector<FoundMarker> &all);
/// Deletes a marker's file; a failure is logged.
void removeMarkerFile(const QString &marker);
