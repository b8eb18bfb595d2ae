#include "Main/AudioEngineController/Effects/Host/AudioPluginHost.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Catalogue/CategoryTable.h"
#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"
#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanLock.h"
#include "Main/VLib/ApplicationContext.h"

#include <QDir>
#include <QFile>

namespace {

const QByteArray &textOf(const CatalogueFormat &format, const ListedEffect &effect)
{
    if (effect.rendered.isNull())
        effect.rendered = renderRecord(format, effect.record);
    return effect.rendered;
}

} // namespace

QString AudioPluginHost::cataloguePath() const
{
    return m_catalogueFolder + QString::fromLatin1(m_format->fileName);
}

QStringList AudioPluginHost::folders() const
{
    const IQuillonInterface *application = ApplicationContext::instance().quillonInterface;
    return application ? application->scanFolders() : QStringList();
}

bool AudioPluginHost::catalogueChanged()
{
    if (!m_format)
        return false;
    const FileStamp stamp = fileStamp(cataloguePath());
    const TAutoLockCS lock(&m_ks);
    const bool changed = stamp != m_lastSeen;
    m_lastSeen = stamp;
    return changed;
}

bool AudioPluginHost::Scan(bool, bool)
{
    refillEffects();
    return false;
}

quint32 AudioPluginHost::maskToCategory(quint32 mask) const
{
    return CategoryTable::instance().maskToCategory(mask);
}

quint32 AudioPluginHost::categoryToMask(quint32 category) const
{
    return CategoryTable::instance().categoryToMask(category);
}

bool AudioPluginHost::AddEffect(const EffectRecord &record)
{
    const TAutoLockCS lock(&m_ks);
    return m_effects.add(record);
}

std::vector<EffectRecord> AudioPluginHost::effects() const
{
    const TAutoLockCS lock(&m_ks);
    std::vector<EffectRecord> records;
    records.reserve(m_effects.size());
    for (const auto &entry : m_effects.entries())
        records.push_back(entry.second.record);
    return records;
}

std::optional<EffectRecord> AudioPluginHost::findEffect(const QString &id) const
{
    const TAutoLockCS lock(&m_ks);
    const EffectRecord *listed = m_effects.find(id);
    return listed ? std::optional<EffectRecord>(*listed) : std::nullopt;
}

LoadedPlugin AudioPluginHost::loadPlugin(const QString &identifier)
{
    const bool isKnown = findEffect(identifier).has_value();
    if (isKnown)
        DebugLog(L"%ls is known, but this host loads no plug-ins", identifier);
    return {isKnown, nullptr};
}

bool AudioPluginHost::isListed(const EffectRecord &record) const
{
    const TAutoLockCS lock(&m_ks);
    const EffectRecord *listed = m_effects.find(record.id);
    return listed && listed->isSamePlugin(record);
}

void AudioPluginHost::clearEffects()
{
    const TAutoLockCS lock(&m_ks);
    m_effects.clear();
}

void AudioPluginHost::refillEffects()
{
    clearEffects();
    for (const EffectRecord *record : m_known.all())
        AddEffect(*record);
}

void AudioPluginHost::ReadCatalogue()
{
    if (!m_format)
        return;
    const TAutoLockCS lock(&m_ks);
    m_known.clear();
    m_leftAlone.clear();
    m_heldMarkers.clear();
    readKnownRecords();
    absorbMarkers();
    m_lastSeen = fileStamp(cataloguePath());
}

CatalogueContents AudioPluginHost::readContents()
{
    const QString path = cataloguePath();
    m_lastSeen = fileStamp(path);
    m_unread.clear();
    if (!QFile::exists(path))
        return {};
    CatalogueContents contents = readCatalogueFile(*m_format, path);
    if (!contents)
        DebugLog(L"Cannot use the catalogue %ls: %ls", path, contents.reason);
    if (contents.isUnread)
        m_unread = contents.reason;
    return contents;
}

void AudioPluginHost::readKnownRecords()
{
    const CatalogueContents contents = readContents();
    if (contents.isBroken) {
        // What crashed must not be loaded again only because of another plug-in's name.
        for (const EffectRecord &record : salvageRecords(*m_format, cataloguePath()))
            if (!record.enabled && !record.working)
                m_known.file(record);
    }
    for (const EffectRecord &record : contents.records)
        m_known.file(record);
    m_catalogueOutdated = contents.upgraded || (!contents && !contents.isUnread);
}

void AudioPluginHost::absorbMarkers()
{
    if (!QDir(m_catalogueFolder).exists())
        return;
    const QStringList paths = findFiles(m_catalogueFolder, QString::fromLatin1(m_format->marker.ending));
    // While its scanner runs, a marker blames nobody.
    if (!paths.isEmpty() && ScanLock::isScannerAtWork(m_catalogueFolder)) {
        DebugLog(L"Another scanner is at work in %ls; its crash markers stay", m_catalogueFolder);
        return;
    }
    std::vector<EffectRecord> markers;
    std::set<QString, PathLess> filesWithCrashedChild;
    for (const QString &path : paths) {
        markers.push_back(ReadCrashMarker(path));
        if (markers.back().subId != 0)
            filesWithCrashedChild.insert(markers.back().path);
    }
    QStringList absorbed;
    for (std::size_t index = 0; index < markers.size(); ++index) {
        const EffectRecord &marker = markers[index];
        const QString &path = paths.at(static_cast<int>(index));
        (isMarkerWithoutRecord(marker) ? m_heldMarkers : absorbed).append(path);
        // The marker of a whole shell is there beside its child's; the child is the culprit.
        if (marker.subId != 0 || filesWithCrashedChild.count(marker.path) == 0)
            absorbMarker(marker);
    }
    if (absorbed.isEmpty() || !writeKnownRecords())
        return; // Markers stay where nothing else holds what they say.
    m_catalogueOutdated = false;
    for (const QString &path : absorbed)
        removeMarkerFile(path);
}

EffectRecord AudioPluginHost::ReadCrashMarker(const QString &marker) const
{
    return readMarkerFile(m_format->marker, marker);
}

void AudioPluginHost::releaseHeldMarkers()
{
    for (const QString &path : m_heldMarkers)
        removeMarkerFile(path);
    m_heldMarkers.clear();
}

bool AudioPluginHost::writeKnownRecords()
{
    WaitingRecords sorted;
    for (const EffectRecord *record : m_known.all())
        if (!record->path.isEmpty()) // an unreadable marker's has none
            sorted.insert({record->id, {*record, {}}});
    std::vector<const QByteArray *> texts;
    for (const auto &entry : sorted)
        texts.push_back(&textOf(*m_format, entry.second));
    return writeRecords(texts, Durability::Synced);
}

void AudioPluginHost::absorbMarker(const EffectRecord &marker)
{
    DebugLog(L"A crash marker names %ls, %ls", marker.name, marker.path);
    if (isMarkerWithoutRecord(marker)) {
        m_leftAlone.insert(marker.path);
        return;
    }
    EffectRecord &crashed = m_known.applyCrash(marker);
    crashed.id = freeIdentifier(crashed, marker.name);
}

QString AudioPluginHost::freeIdentifier(const EffectRecord &plugin, const QString &name) const
{
    if (plugin.path.isEmpty())
        return name; // of an unreadable marker: nothing to tell apart
    const auto isFree = [&](const QString &candidate) {
        const EffectRecord *listed = m_effects.find(candidate);
        return !candidate.isEmpty() && !(listed && !listed->isSamePlugin(plugin)) &&
               !m_known.isIdHeldByOther(candidate, plugin);
    };
    const QString ofSubPlugin = plugin.path + QLatin1Char(':') + QString::number(plugin.subId);
    for (const QString &candidate : {name, plugin.path, ofSubPlugin})
        if (isFree(candidate))
            return candidate;
    int number = 2;
    QString numbered;
    do
        numbered = ofSubPlugin + QLatin1Char(':') + QString::number(number++);
    while (!isFree(numbered));
    return numbered;
}

void AudioPluginHost::completeFailedRecord(EffectRecord &record) const
{
    if (record.subId == 0)
        NameFromPath(record);
    record.id = freeIdentifier(record, record.name);
    record.enabled = true;
    record.working = false;
}

QString AudioPluginHost::freeMarkerPath(const EffectRecord &plugin) const
{
    const auto named = [&](const QString &name) {
        return markerPath(m_format->marker, m_catalogueFolder, plugin.path, name);
    };
    // Those of files that are left alone must stay too: a file of the same name would bring them back.
    const auto isTaken = [&](const QString &marker) {
        return ActiveMarkers::contains(marker) || m_heldMarkers.contains(marker, Qt::CaseInsensitive);
    };
    QString marker = named(plugin.name);
    // A sub-plug-in may bear the name of its shell, whose own marker must stay as it is.
    if (isTaken(marker) && plugin.subId != 0)
        marker = named(plugin.name + QLatin1Char('_') + QString::number(plugin.subId));
    for (int number = 2; isTaken(marker); ++number) // in front, as the ends of long names are cut off
        marker = named(QString::number(number) + QLatin1Char('_') + plugin.name);
    return marker;
}

QString AudioPluginHost::WriteCrashMarker(const EffectRecord &plugin, const QString &name)
{
    EffectRecord content = plugin;
    content.name = name;
    if (name.isNull())
        NameFromPath(content);
    const QString marker = freeMarkerPath(content);
    // Registered first: whoever abandons the markers must find this one whenever it is on disk.
    ActiveMarkers::add(marker);
    if (const FileResult written = writeMarkerFile(m_format->marker, marker, content); !written)
        DebugLog(L"Cannot write the crash marker %ls: %ls", marker, written.reason);
    return marker;
}

bool AudioPluginHost::WriteCatalogue(const WaitingRecords &waiting, Durability durability)
{
    const TAutoLockCS lock(&m_ks);
    std::vector<const QByteArray *> texts;
    texts.reserve(m_effects.size() + waiting.size());
    auto next = waiting.begin();
    for (const auto &[id, effect] : m_effects.entries()) {
        for (; next != waiting.end() && next->first < id; ++next)
            texts.push_back(&textOf(*m_format, next->second));
        texts.push_back(&textOf(*m_format, effect));
    }
    for (; next != waiting.end(); ++next)
        texts.push_back(&textOf(*m_format, next->second));
    return writeRecords(texts, durability);
}

bool AudioPluginHost::writeRecords(const std::vector<const QByteArray *> &records, Durability durability)
{
    const QString path = cataloguePath();
    // What could not be read is not lost, and may hold marks of the user.
    const FileResult written = isCatalogueUnread()
                                   ? FileResult{QStringLiteral("the one there cannot be read: ") + m_unread}
                                   : replaceFile(path, renderCatalogue(*m_format, records), durability);
    if (!written) {
        DebugLog(L"Cannot write the catalogue %ls: %ls", path, written.reason);
        ProbeReport::instance().unwritten(path, written.reason);
    }
    return bool(written);
}
