#include "Main/AudioEngineController/Effects/Host/ScanMemory.h"

#include "Core/BaseLib/Log/DebugLog.h"

#include <algorithm>
#include <map>

namespace {

void setHolderIn(RememberedProbe &probe, const QString &id, const QString &holder)
{
    for (RememberedPlugin &plugin : probe.plugins)
        if (plugin.id == id)
            plugin.heldBy = holder;
}

} // namespace

ScanMemory::ScanMemory(const CatalogueHost &host)
    : m_host(host)
    , m_probes(host.probeMemory() ? host.probeMemory()
                                  : std::make_shared<ProbeMemory>(host.catalogueFolder()))
{}

void ScanMemory::childEnded(quint32 subId, const QString &reason, const QStringList &frames)
{
    m_item.plugins.push_back({QString(), subId, reason, -1, -1, QString(), QString(), frames});
}

void ScanMemory::end(const EffectRecord &file, const ProbeOutcome &outcome, bool isAsked)
{
    std::map<quint32, RememberedPlugin> children;
    for (const RememberedPlugin &child : m_item.plugins)
        children[child.subId] = child;
    m_item.format = m_host.format();
    m_item.path = file.path;
    m_item.fileTime = file.fileTime;
    m_item.status = outcome.status;
    m_item.isUnsettled = isCrash(outcome.status);
    m_item.stage = outcome.stage;
    m_item.reason = outcome.reason;
    m_item.frames = outcome.frames;
    m_item.milliseconds = isAsked ? outcome.milliseconds : 0;
    m_item.plugins.clear();
    for (const EffectRecord &record : outcome.records)
        m_item.plugins.push_back({record.id, record.subId, children[record.subId].reason, record.inputs,
                                  record.outputs, QString(), record.name, children[record.subId].frames});
    if (isCrash(outcome.status) && outcome.records.empty())
        m_item.plugins = m_probes->listed(m_host.format(), file.path);
}

void ScanMemory::setHolder(const QString &id, const QString &holder) { setHolderIn(m_item, id, holder); }

void ScanMemory::setHolder(const QString &file, const QString &id, const QString &holder)
{
    const RememberedProbe *last = m_probes->find(m_host.format(), file);
    if (!last)
        return;
    RememberedProbe changed = *last;
    setHolderIn(changed, id, holder);
    m_probes->set(changed);
}

void ScanMemory::write(bool isLast)
{
    constexpr qint64 kPause = 100; // ms
    constexpr qint64 kShare = 20;  // of the time goes into writing at most a twentieth
    const qint64 pause = m_item.reason.isEmpty() ? std::max(kPause, m_pause) : m_pause;
    if (!isLast && m_sinceWrite.isValid() && !m_sinceWrite.hasExpired(pause))
        return;
    m_sinceWrite.start();
    if (const FileResult written = m_probes->write(); !written)
        DebugLog(L"Cannot write %ls: %ls", QString::fromLatin1(kProbeMemoryFile + 1), written.reason);
    m_pause = kShare * m_sinceWrite.elapsed();
    m_sinceWrite.start();
}
