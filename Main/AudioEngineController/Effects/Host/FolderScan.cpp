#include "Main/AudioEngineController/Effects/Host/FolderScan.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/VLib/SimpleGUI.h"
#include "Main/VLib/VProgressDisplay.h"

#include <QSet>

#include <algorithm>
#include <exception>

FolderScan::FolderScan(AudioPluginHost &host, const char *format)
    : m_host(host)
    , m_format(format)
    , m_finder(host.fileFinder() ? host.fileFinder()
                                 : std::make_shared<FileFinder>(QStringList(host.moduleEnding())))
{}

FolderScan::~FolderScan() = default;

bool FolderScan::run()
{
    try {
        scan();
    } catch (const std::exception &error) {
        DebugLog(L"The scan ended early: %s", error.what());
    } catch (...) {
        DebugLog(L"The scan ended early");
    }
    return m_written;
}

void FolderScan::scan()
{
    m_host.clearEffects();
    if (m_host.isCatalogueUnread()) {
        write(Durability::Synced); // says why it cannot: nothing would come of the probes, and known crashes
        return;                    // would happen again
    }
    m_progress = createProgressDisplay();
    m_knownAtStart = m_host.known().size();
    const QStringList paths = findFiles();
    keepUnread();
    m_items = arrange(paths);
    reportPlan(static_cast<std::size_t>(paths.size()));
    if (processItems())
        finish();
    else
        finishCancelled();
}

bool FolderScan::isCancelled() const
{
    return m_host.isCancelled() || (m_progress && m_progress->isCancelled());
}

QStringList FolderScan::findFiles() const
{
    QStringList paths;
    QSet<QString> seen;
    for (const QString &folder : m_host.folders())
        for (const QString &path :
             m_finder->find(folder, m_host.moduleEnding(), [this] { return isCancelled(); })) {
            seen.insert(pathKey(path));
            if (seen.size() > paths.size())
                paths.append(path);
        }
    return paths;
}

void FolderScan::keepUnread()
{
    for (const QString &folder : m_finder->unread())
        for (const EffectRecord *record : m_host.known().all())
            if (record->path.startsWith(folder + QLatin1Char('/'), kPathCase))
                m_host.AddEffect(*record);
}

void FolderScan::showItemProgress()
{
    if (!m_progress)
        return;
    m_progress->setRange(static_cast<int>(m_items.size()), QString());
    m_progress->setValue(static_cast<int>(m_done));
}

void FolderScan::keep(const KnownList::Records &records)
{
    for (const EffectRecord *record : records)
        m_host.AddEffect(*record);
}

void FolderScan::collectWaiting()
{
    for (std::size_t index = m_done + 1; index < m_items.size(); ++index)
        for (const EffectRecord &record : m_items[index].knownRecords)
            addWaiting(record);
}

void FolderScan::reportPlan(std::size_t files) const
{
    const auto isProbed = [](const ScanItem &item) { return item.probe; };
    const auto probes = std::count_if(m_items.begin(), m_items.end(), isProbed);
    ProbeReport::instance().plan(m_format, files, static_cast<std::size_t>(probes));
}

bool FolderScan::processItems()
{
    showItemProgress();
    for (const ScanItem &item : m_items) {
        if (isCancelled())
            return false;
        processItem(item);
        ++m_done;
        if (m_progress)
            m_progress->setValue(static_cast<int>(m_done));
    }
    return !isCancelled();
}

void FolderScan::processItem(const ScanItem &item)
{
    const bool added = process(item);
    removeWaiting(item);
    if (!item.probe)
        return;
    m_probed.insert(item.path);
    if (!added)
        return;
    if (!m_added) // not before: most scans find nothing new
        collectWaiting();
    m_added = true;
    write(Durability::Buffered);
}

void FolderScan::finishCancelled()
{
    ProbeReport::instance().cancelled();
    // Nothing is lost: whatever this run did not get to stays as it was.
    m_waiting.clear();
    for (const EffectRecord *record : m_host.known().all())
        if (m_probed.count(record->path) == 0)
            addWaiting(*record);
    write(Durability::Synced);
}

void FolderScan::finish()
{
    complete();
    m_waiting.clear();
    const bool countDiffers = m_host.effectCount() != m_knownAtStart;
    if (m_added || countDiffers || m_knownAtStart == 0 || m_host.isCatalogueOutdated())
        write(Durability::Synced);
}

void FolderScan::write(Durability durability) { m_written |= m_host.WriteCatalogue(m_waiting, durability); }

void FolderScan::addWaiting(const EffectRecord &record)
{
    if (!record.path.isEmpty() && !m_host.isListed(record))
        m_waiting.insert({record.id, {record, {}}});
}

void FolderScan::removeWaiting(const ScanItem &item)
{
    for (const EffectRecord &record : item.knownRecords) {
        const auto [first, last] = m_waiting.equal_range(record.id);
        const auto entry = std::find_if(
            first, last, [&](const auto &waiting) { return waiting.second.record.isSamePlugin(record); });
        if (entry != last)
            m_waiting.erase(entry);
    }
}
