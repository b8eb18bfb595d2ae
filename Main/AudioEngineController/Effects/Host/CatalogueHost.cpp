#include "Main/AudioEngineController/Effects/Host/CatalogueHost.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Host/FolderScan.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanLock.h"

#include <QDir>
#include <QFile>
#include <QRegularExpression>

#include <algorithm>
#include <map>
#include <utility>

namespace {

/// Whether a file's name could be the identifier of one of its format's plug-ins.
bool looksLikeIdentifier(const CatalogueFormat &format, const QString &name)
{
    const QString form = QString::fromLatin1(format.identifierForm);
    return QRegularExpression(QRegularExpression::anchoredPattern(form)).match(name).hasMatch();
}

} // namespace

CatalogueHost::CatalogueHost(PluginFormat format)
    : m_info(formatInfo(format))
    , m_known(m_info.catalogue->identity)
{}

QString CatalogueHost::cataloguePath() const
{
    return catalogueFolder() + QString::fromLatin1(m_info.catalogue->fileName);
}

bool CatalogueHost::catalogueChanged()
{
    const FileStamp stamp = fileStamp(cataloguePath());
    const TAutoLockCS lock(&m_ks);
    const bool changed = stamp != m_lastSeen;
    m_lastSeen = stamp;
    return changed;
}

bool CatalogueHost::Scan(bool scan, bool)
{
    if (!scan) {
        refillEffects();
        return false;
    }
    if (!m_scan)
        prepareScan();
    return std::exchange(m_scan, nullptr)->run();
}

void CatalogueHost::prepareScan()
{
    m_scan = std::make_shared<FolderScan>(*this);
    m_scan->prepare();
}

bool CatalogueHost::AddEffect(const EffectRecord &record)
{
    const TAutoLockCS lock(&m_ks);
    return m_effects.add(record);
}

std::vector<EffectRecord> CatalogueHost::effects() const
{
    const TAutoLockCS lock(&m_ks);
    std::vector<EffectRecord> records;
    records.reserve(m_effects.size());
    for (const auto &entry : m_effects.entries())
        records.push_back(entry.second.record);
    return records;
}

std::optional<EffectRecord> CatalogueHost::findEffect(const QString &id) const
{
    const TAutoLockCS lock(&m_ks);
    const EffectRecord *listed = m_effects.find(id);
    return listed ? std::optional<EffectRecord>(*listed) : std::nullopt;
}

bool CatalogueHost::isListed(const QString &id) const
{
    const TAutoLockCS lock(&m_ks);
    return m_effects.find(id) != nullptr;
}

void CatalogueHost::passMarks(const EffectRecord &old, const QString &id)
{
    const TAutoLockCS lock(&m_ks);
    m_effects.passMarks(old, id);
}

void CatalogueHost::setHidden(const QString &id, bool isHidden)
{
    const TAutoLockCS lock(&m_ks);
    m_effects.setHidden(id, isHidden);
}

void CatalogueHost::setUnsettled(const QString &id, bool isUnsettled)
{
    const TAutoLockCS lock(&m_ks);
    m_effects.setUnsettled(id, isUnsettled);
}

QString CatalogueHost::moduleTime(const QString &path) const { return regularFileTimeText(path); }

QString CatalogueHost::moduleFolder(const QString &path) const
{
    return path.left(path.lastIndexOf(QLatin1Char('/')));
}

void CatalogueHost::clearEffects()
{
    const TAutoLockCS lock(&m_ks);
    m_effects.clear();
}

void CatalogueHost::refillEffects()
{
    clearEffects();
    for (const EffectRecord *record : m_known.all())
        AddEffect(*record);
}

void CatalogueHost::ReadCatalogue()
{
    const TAutoLockCS lock(&m_ks);
    m_known.clear();
    m_leftAlone.clear();
    m_newCrashes.clear();
    m_suspects.clear();
    m_givenUp.clear();
    m_heldMarkers.clear();
    m_unwrittenMarkers.clear();
    m_written.clear();
    readKnownRecords();
    absorbMarkers();
    m_lastSeen = fileStamp(cataloguePath());
}

CatalogueContents CatalogueHost::readContents()
{
    const QString path = cataloguePath();
    m_lastSeen = fileStamp(path);
    m_unread.clear();
    if (!QFile::exists(path))
        return {};
    CatalogueContents contents = readCatalogueFile(
        *m_info.catalogue, path, [this](const QString &module) { return moduleTime(module); });
    if (!contents)
        DebugLog(L"Cannot use the catalogue %ls: %ls", path, contents.reason);
    if (contents.isUnread)
        m_unread = contents.reason;
    return contents;
}

void CatalogueHost::readKnownRecords()
{
    m_rules = readFolderRules(catalogueFolder());
    if (!m_rules)
        DebugLog(L"Cannot use %ls of %ls: %ls", QString::fromLatin1(kFolderRulesFile + 1), catalogueFolder(),
                 m_rules.reason);
    CatalogueContents contents = readContents();
    m_isKnownAsRead = contents.isAsWritten;
    for (EffectRecord &record : contents.records) {
        if (m_rules) // else what is ignored stays so
            m_isKnownAsRead &= !settleIgnored(record, m_rules.isIgnored(record.path));
        m_isKnownAsRead &= m_known.addRecord(record);
    }
    m_isKnownAsRead &= !m_known.disableBesideCrashed();
}

void CatalogueHost::absorbMarkers()
{
    if (!QDir(catalogueFolder()).exists())
        return;
    const QStringList files =
        findFiles(catalogueFolder(), QString::fromLatin1(m_info.catalogue->marker.ending),
                  FileFinder::Links::NotEntered); // they are deleted
    // While its scanner runs, a marker blames nobody.
    if (!files.isEmpty() && ScanLock::isScannerAtWork(catalogueFolder())) {
        DebugLog(L"Another scanner is at work in %ls; its crash markers stay", catalogueFolder());
        return;
    }
    QStringList absorbed;
    std::vector<EffectRecord> crashes;
    const std::vector<FoundMarker> markers = readMarkers(files);
    for (const FoundMarker &marker : markers) {
        if (marker.isSuspect) { // stays until the plug-in was asked alone
            m_suspects[marker.plugin.path] = marker.file;
            continue;
        }
        (isMarkerWithoutRecord(marker.plugin) ? m_heldMarkers : absorbed).append(marker.file);
        if (!isExcused(marker, markers) && absorbMarker(marker.plugin))
            crashes.push_back(marker.plugin);
    }
    if (absorbed.isEmpty())
        return;
    rememberCrashes(crashes);
    if (!writeKnownRecords()) { // they stay: nothing else holds what they say
        m_unwrittenMarkers = absorbed;
        return;
    }
    for (const QString &file : absorbed)
        removeMarkerFile(file);
}

/// True when the known list holds what it says.
bool CatalogueHost::absorbMarker(const EffectRecord &marker)
{
    DebugLog(L"A crash marker names %ls, %ls", marker.name, marker.path);
    if (marker.path.isEmpty())
        return false; // a damaged one
    if (isMarkerWithoutRecord(marker)) {
        m_leftAlone.insert(marker.path);
        return false;
    }
    applyCrash(marker);
    return true;
}

/// Has later runs know that these crashes are new, as this one may end before it has settled what moved. The
/// launcher, which saw the end, knows the reason.
void CatalogueHost::rememberCrashes(const std::vector<EffectRecord> &markers) const
{
    const auto memory = probeMemory() ? probeMemory() : std::make_shared<ProbeMemory>(catalogueFolder());
    for (const EffectRecord &marker : markers)
        memory->addCrash(format(), marker);
    if (const FileResult written = memory->write(); !written)
        DebugLog(L"Cannot write what is known of crashes: %ls", written.reason);
}

void CatalogueHost::applyCrash(const EffectRecord &marker)
{
    m_newCrashes.insert(pathKey(marker.path));
    const EffectRecord &crashed = m_known.applyCrash(marker);
    m_known.setIdentifier(crashed, freeIdentifier(crashed, marker.name));
    m_isKnownAsRead = false;
}

EffectRecord CatalogueHost::ReadCrashMarker(const QString &marker) const
{
    return readMarkerFile(m_info.catalogue->marker, marker);
}

CrashMarker CatalogueHost::WriteCrashMarker(const EffectRecord &plugin, const QString &name) const
{
    return CrashMarker(m_info.catalogue->marker, catalogueFolder(), plugin, name, takenMarkers());
}

/// The markers that are there must stay as they are: they still have something to tell.
QStringList CatalogueHost::takenMarkers() const
{
    QStringList taken = m_heldMarkers + m_unwrittenMarkers;
    for (const auto &suspect : m_suspects)
        taken.append(suspect.second);
    return taken;
}

CrashMarker CatalogueHost::writeSuspectMarker(const EffectRecord &plugin) const
{
    return CrashMarker(m_info.catalogue->marker, catalogueFolder(), plugin, QString(), takenMarkers(), true);
}

void CatalogueHost::clearSuspect(const QString &path)
{
    const auto suspect = m_suspects.find(path);
    if (suspect == m_suspects.end())
        return;
    removeMarkerFile(suspect->second);
    m_suspects.erase(suspect);
}

void CatalogueHost::clearSuspects(const std::function<bool(const QString &path)> &mayBeAsked)
{
    QStringList paths;
    for (const auto &suspect : m_suspects)
        if (!mayBeAsked(suspect.first))
            paths.append(suspect.first);
    for (const QString &path : paths)
        clearSuspect(path);
}

void CatalogueHost::scansEnded()
{
    m_written.clear();
    if (isCatalogueUnread())
        return;
    for (const QString &file : m_heldMarkers)
        removeMarkerFile(file);
    m_heldMarkers.clear();
}

bool CatalogueHost::writeKnownRecords()
{
    std::map<QString, const EffectRecord *> sorted;
    for (const EffectRecord &record : m_known.inOrder())
        sorted.emplace(record.id, &record); // of two with one identifier the first stays
    std::vector<EffectRecord> records;
    records.reserve(sorted.size());
    for (const auto &entry : sorted)
        records.push_back(*entry.second);
    return writeText(renderCatalogue(*m_info.catalogue, records), Durability::Synced);
}

QByteArray CatalogueHost::render(WaitingRecords &waiting)
{
    const TAutoLockCS lock(&m_ks);
    std::vector<const QByteArray *> texts;
    texts.reserve(m_effects.size() + waiting.size());
    QString last; // identifiers of waiting records may come twice
    auto next = waiting.begin();
    const auto addWaitingBefore = [&](const QString *id) {
        for (; next != waiting.end() && (!id || next->first < *id); ++next)
            if (next->first != last) {
                texts.push_back(&next->second.text(*m_info.catalogue));
                last = next->first;
            }
    };
    for (auto &[id, effect] : m_effects.entries()) {
        if (effect.isHidden)
            continue;
        addWaitingBefore(&id);
        texts.push_back(&effect.text(*m_info.catalogue));
        last = id;
    }
    addWaitingBefore(nullptr);
    return renderCatalogue(*m_info.catalogue, texts);
}

bool CatalogueHost::writeInterim(WaitingRecords &waiting, Durability durability)
{
    return writeText(render(waiting), durability);
}

/// Whether the file, as it was read, holds exactly what is listed now. Quick: nothing is rendered.
bool CatalogueHost::matchesFile() const
{
    const auto isSame = [](const EffectList::Entries::value_type &listed, const EffectRecord &known) {
        return listed.second.record == known;
    };
    const auto &entries = m_effects.entries();
    const auto &known = m_known.inOrder();
    return m_isKnownAsRead && m_written.isNull() &&
           std::equal(entries.begin(), entries.end(), known.begin(), known.end(), isSame);
}

bool CatalogueHost::writeIfChanged(WaitingRecords &waiting)
{
    if (waiting.empty() && matchesFile())
        return false;
    const QByteArray text = render(waiting);
    QByteArray present = m_written;
    if (present.isNull())
        readWholeFile(cataloguePath(), present);
    if (present.isNull() && m_effects.size() == 0 && waiting.empty() && !m_info.catalogue->isWrittenEmpty)
        return false;
    return text != present && writeText(text, Durability::Synced);
}

bool CatalogueHost::writeText(const QByteArray &text, Durability durability)
{
    const QString path = cataloguePath();
    // What could not be read is not lost, and may hold marks of the user.
    const FileResult written = isCatalogueUnread()
                                   ? FileResult{QStringLiteral("the one there cannot be read: ") + m_unread}
                                   : replaceFile(path, text, durability);
    m_hasFailedToWrite = !written;
    if (written) {
        m_written = text;
    } else {
        DebugLog(L"Cannot write the catalogue %ls: %ls", path, written.reason);
        ProbeReport::instance().unwritten(path, written.reason);
    }
    return bool(written);
}

QString CatalogueHost::freeIdentifier(const EffectRecord &plugin, const QString &name) const
{
    const auto isFree = [&](const QString &candidate) {
        const EffectRecord *listed = m_effects.find(candidate);
        return !(listed && !listed->isSamePlugin(plugin)) &&
               (m_givenUp.count(candidate) != 0 || !m_known.isIdHeldByOther(candidate, plugin));
    };
    // Only of the name is asked what it looks like: a damaged marker's path may look like an identifier, and
    // so would every text made of it.
    if (!name.isEmpty() && !looksLikeIdentifier(*m_info.catalogue, name) && isFree(name))
        return name;
    const QString ofSubPlugin = plugin.path + QLatin1Char(':') + QString::number(plugin.subId);
    for (const QString &candidate : {plugin.path, ofSubPlugin})
        if (!candidate.isEmpty() && isFree(candidate))
            return candidate;
    int number = 2;
    QString numbered;
    do
        numbered = ofSubPlugin + QLatin1Char(':') + QString::number(number++);
    while (!isFree(numbered));
    return numbered;
}

void CatalogueHost::completeFailedRecord(EffectRecord &record) const
{
    if (record.subId == 0)
        NameFromPath(record);
    record.id = freeIdentifier(record, record.name);
    record.enabled = true;
    record.working = false;
}
