#include "Main/AudioEngineController/Effects/Launcher/MarkerWatch.h"

#include <QDir>
#include <QFile>

#include <algorithm>

namespace {

const QStringList &markerPatterns()
{
    static const QStringList patterns{QStringLiteral("*.scan"), QStringLiteral("*.scan3")};
    return patterns;
}

const QStringList &allPatterns()
{
    static const QStringList patterns = markerPatterns() + QStringList(QStringLiteral("*Configuration.xml"));
    return patterns;
}

bool isMarker(const QString &path)
{
    return path.endsWith(QLatin1String(".scan")) || path.endsWith(QLatin1String(".scan3"));
}

/// The newest marker; none when there is no marker.
template <typename Stamps>
Stamps newestMarker(const Stamps &stamps)
{
    auto newest = stamps.end();
    for (auto entry = stamps.begin(); entry != stamps.end(); ++entry) {
        const bool isNewer =
            newest == stamps.end() || entry->second.modifiedNanoseconds > newest->second.modifiedNanoseconds;
        if (isMarker(entry->first) && isNewer)
            newest = entry;
    }
    return newest == stamps.end() ? Stamps() : Stamps{*newest};
}

} // namespace

MarkerWatch::MarkerWatch(const QString &effectsFolder, const QString &report)
    : m_folder(effectsFolder)
    , m_report(report)
    , m_before(stampsOf(allPatterns()))
{}

void MarkerWatch::look()
{
    const Stamps changed = ofRun(stampsOf(allPatterns()));
    const Stamps marker = newestMarker(changed);
    m_hasBegun |= !changed.empty();
    const bool mayBeStuck = !marker.empty() || (m_report.isEmpty() ? m_hasBegun : hasReportedItsEnd());
    const Stamps &now = marker.empty() ? changed : marker;
    m_unchanged = mayBeStuck && now == m_last ? m_unchanged + 1 : 0;
    m_last = now;
}

bool MarkerWatch::hasReportedItsEnd() const
{
    constexpr qint64 kTail = 64; // bytes; longer than the last line
    QFile file(m_report);
    if (!file.open(QIODevice::ReadOnly))
        return false;
    file.seek(std::max<qint64>(0, file.size() - kTail));
    const QByteArray tail = file.readAll();
    return tail.endsWith("{\"event\":\"finished\"}\n") || tail.endsWith("{\"event\":\"ended\"}\n");
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
