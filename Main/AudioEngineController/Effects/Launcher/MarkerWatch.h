#pragma once

#include "Core/BaseLib/Files/FileTime.h"
#include "Main/AudioEngineController/Effects/Protocol/ReportReader.h"

#include <QString>
#include <QStringList>

#include <map>
#include <optional>

/// Watches the crash markers of a scanner's run from outside, without absorbing any: tells those that the run
/// wrote from those that it found, and whether it gets on.
class MarkerWatch {
public:
    /// Remembers what lies in the Effects folder; made before the run starts. `report` is the file to which
    /// the run reports its course; empty: it reports none.
    MarkerWatch(const QString &effectsFolder, const QString &report);

    /// Looks again; called at regular times.
    void look();
    /// For how many looks in a row the newest marker of the run has not changed. While it has none, for how
    /// many looks it has outlived its own report's last line; of a run without a report, for how many nothing
    /// has changed in the folder since it began to work.
    int looksWithoutChange() const { return m_unchanged; }

    /// For how many looks in a row neither the report nor anything in the folder has changed.
    int looksWithoutNews() const { return m_silent; }
    /// The last stage that the run reported; none before the first.
    std::optional<ProbeStage> lastStage() const { return m_lastStage; }

    /// All markers that lie in the folder now, of both formats.
    QStringList markers() const;
    /// Those among them that the run wrote.
    QStringList markersOfRun() const;

private:
    using Stamps = std::map<QString, FileStamp>;

    Stamps stampsOf(const QStringList &patterns) const;
    Stamps ofRun(const Stamps &stamps) const;

    QString m_folder;
    bool m_reportsCourse;
    ReportReader m_report;
    Stamps m_before;
    Stamps m_last;
    bool m_hasBegun = false;
    bool m_hasReportedItsEnd = false;
    std::optional<ProbeStage> m_lastStage;
    int m_unchanged = 0;
    int m_silent = 0;
    Stamps m_lastSeen;
};
