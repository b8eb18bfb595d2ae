#include "Main/AudioEngineController/Effects/Launcher/MarkerWatch.h"

#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"

#include <QDir>

namespace {

const QStringList &allPatterns()
{
    static const QStringList patterns = markerPatterns() + QStringList(QStringLiteral("*Configuration.xml"));
    return patterns;
}

/// The newest marker; none when there is no marker.
template <typename Stamps>
Stamps newestMarker(const Stamps &stamps)
{
    auto newest = stamps.end();
    for (auto entry = stamps.begin(); entry != stamps.end(); ++entry) {
        const bool isNewer =
            newest == stamps.end() || entry->second.modifiedNanoseconds > newest->second.modifiedNanoseconds;
        if (formatOfMarker(entry->first) && isNewer)
            newest = entry;
    }
    return newest == stamps.end() ? Stamps() : Stamps{*newest};
}

} // namespace

MarkerWatch::MarkerWatch(const QString &effectsFolder, const QString &report)
    : m_folder(effectsFolder)
    , m_reportsCourse(!report.isEmpty())
    , m_report(report)
    , m_before(stampsOf(allPatterns()))
{}

void MarkerWatch::look()
{
    const Stamps changed = ofRun(stampsOf(allPatterns()));
    const Stamps marker = newestMarker(changed);
    m_hasBegun |= !changed.empty();
    const std::vector<ReportLine> news = m_report.takeNewLines();
    m_silent = news.empty() && changed == m_lastSeen ? m_silent + 1 : 0;
    m_lastSeen = changed;
    for (const ReportLine &line : news) {
        m_hasReportedItsEnd = line.isLast();
        if (line.event == ReportLine::Event::Begin)
            m_lastStage.reset();
        else if (line.event == ReportLine::Event::Stage)
            m_lastStage = line.stage;
    }
    const bool mayBeStuck = !marker.empty() || (m_reportsCourse ? m_hasReportedItsEnd : m_hasBegun);
    const Stamps &now = marker.empty() ? changed : marker;
    m_unchanged = mayBeStuck && now == m_last ? m_unchanged + 1 : 0;
    m_last = now;
}

QStringList MarkerWatch::markers() const
{
    QStringList paths;
    for (const auto &entry : stampsOf(markerPatterns()))
        paths.append(entry.first);
    return paths;
}

QStringList MarkerWatch::markersOfRun() const
{
    QStringList paths;
    for (const auto &entry : ofRun(stampsOf(markerPatterns())))
        paths.append(entry.first);
    return paths;
}

MarkerWatch::Stamps MarkerWatch::stampsOf(const QStringList &patterns) const
{
    Stamps stamps;
    const QDir folder(m_folder);
    for (const QString &name : folder.entryList(patterns, QDir::Files)) {
        const QString path = folder.filePath(name);
        if (const FileStamp stamp = fileStamp(path); stamp != FileStamp())
            stamps.emplace(path, stamp);
    }
    return stamps;
}

MarkerWatch::Stamps MarkerWatch::ofRun(const Stamps &stamps) const
{
    Stamps changed;
    for (const auto &entry : stamps) {
        const auto before = m_before.find(entry.first);
        if (before == m_before.end() || before->second != entry.second)
            changed.insert(entry);
    }
    return changed;
}
