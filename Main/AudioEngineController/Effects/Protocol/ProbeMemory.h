#pragma once

#include "Core/BaseLib/Files/TextFile.h"
#include "Main/AudioEngineController/Effects/Protocol/Probe.h"

#include <QByteArray>
#include <QString>

#include <functional>
#include <map>
#include <optional>
#include <vector>

/// Name of the file, appended to the Effects folder.
inline constexpr char kProbeMemoryFile[] = "/FXProbes.json";

/// What the last probe of a file said of one plug-in in it.
struct RememberedPlugin {
    QString id;           ///< empty: of a sub-plug-in that failed
    quint32 subId = 0;    ///< of a shell's sub-plug-in
    QString reason;       ///< why it failed
    qint32 inputs = -1;   ///< audio input channels; -1: unknown
    qint32 outputs = -1;  ///< audio output channels; -1: unknown
    QString heldBy;       ///< the file that has the record of the identifier; empty: this one has
    QString name{};       ///< its own, which another plug-in may have in the catalogue
    QStringList frames{}; ///< of a sub-plug-in that crashed; see `ProbeOutcome`
};

/// What the last probe of a file came to.
struct RememberedProbe {
    PluginFormat format = PluginFormat::Unknown;
    QString path;
    QString fileTime; ///< of the file that was probed
    ProbeStatus status = ProbeStatus::Failed;
    ProbeStage stage = ProbeStage::Load;
    QString reason;
    QStringList frames; ///< where it crashed; see `ProbeOutcome`
    double milliseconds = 0;
    /// It crashed, and no scan that saw all folders has come to its end since: a file that is gone may yet
    /// turn out to have moved there.
    bool isUnsettled = false;
    std::vector<RememberedPlugin> plugins; ///< of a file that crashed: what it listed before

    /// True for a copy: other files hold the identifiers of everything that it lists.
    bool isCopy() const;
    /// Whether another file holds the identifier of anything that it lists.
    bool hasPluginsOf(const QString &holder) const;
    /// Why a plug-in of the file, or the file itself (0), failed; empty when nobody knows.
    QString reasonOf(quint32 subId) const;
    /// Where a plug-in of the file, or the file itself (0), crashed; empty when it did not, or nobody knows.
    const QStringList &framesOf(quint32 subId) const;
};

/// The outcomes of the last probes, of all formats, in a file beside the catalogues, which have no place for
/// them. Losing the file costs the reasons, and the time to probe copies again; and marks where nothing else
/// tells whose they are: of a file that moved and crashed in a scan that was cut off, and of a crashed copy.
/// docs/protocol.md describes it.
class ProbeMemory {
public:
    /// Remembers nothing yet; the file is read when the first question is asked.
    explicit ProbeMemory(const QString &effectsFolder);

    /// The last probe of a file; null when there is none.
    const RememberedProbe *find(PluginFormat format, const QString &path) const;
    /// Calls back for each probe of a format.
    void forEach(PluginFormat format, const std::function<void(const RememberedProbe &)> &operation) const;
    /// Which plug-ins a file listed when it was asked last: what a crash leaves of what was known.
    std::vector<RememberedPlugin> listed(PluginFormat format, const QString &path) const;
    void set(const RememberedProbe &probe);
    /// Remembers that a plug-in, or a sub-plug-in, ended the process that probed it, or gave no answer. Of
    /// the plug-in its path, file time, identifier and name count. The crash is unsettled.
    void setCrash(PluginFormat format, const EffectRecord &plugin, ProbeStatus status, const QString &reason);
    /// The same of a crash of which only the marker tells. What is known of it already stays.
    void addCrash(PluginFormat format, const EffectRecord &marker);
    /// Whether any crash of a format is unsettled. Quick while nothing else was asked.
    bool hasUnsettled(PluginFormat format) const;
    /// No crash of a format is unsettled any more.
    void settle(PluginFormat format);
    /// Forgets the files of a format for which the answer is false.
    void keepOnly(PluginFormat format, const std::function<bool(const QString &path)> &isKept);

    /// Replaces the file, if anything changed since it was read or written.
    FileResult write();

private:
    using Key = std::pair<PluginFormat, QString>; ///< of a path without what file names do not tell apart
    struct Entry {
        RememberedProbe probe;
        QByteArray text; ///< as it stands in the file; rendered once
    };
    std::map<Key, Entry> &entries() const;
    std::map<Key, Entry> readEntries() const;

    QString m_file;
    mutable std::optional<std::map<Key, Entry>> m_entries; ///< nothing before the file was read
    bool m_changed = false;
};

/// For reports, files and people: "listed", "failed", "no plug-in", "crashed", "no answer", "cancelled",
/// "skipped".
const char *statusText(ProbeStatus status);
/// "load", "start", "ask", "close".
const char *stageText(ProbeStage stage);
/// The status that a text names; nothing for a text of another version.
std::optional<ProbeStatus> statusOfText(const QString &text);
