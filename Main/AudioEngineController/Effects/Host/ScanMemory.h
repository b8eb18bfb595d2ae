#pragma once

#include "Main/AudioEngineController/Effects/Host/CatalogueHost.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"

#include <QElapsedTimer>

#include <memory>

/// What one scan of a format's folders puts into the memory of probes, item by item, and when that is
/// written. Used on the scan worker.
class ScanMemory {
public:
    /// The host must outlive it.
    explicit ScanMemory(const CatalogueHost &host);

    /// All that is remembered.
    const ProbeMemory &probes() const { return *m_probes; }

    /// Remembers that a file crashed whose turn among the items has not come yet.
    void addCrash(const EffectRecord &file, const ProbeOutcome &outcome)
    {
        m_probes->setCrash(m_host.format(), file, outcome.status, outcome.reason);
    }
    /// Has all crashes count as settled: what may have moved to where they are has.
    void settleCrashes() { m_probes->settle(m_host.format()); }
    /// Forgets the files of this format of which the condition does not hold.
    void keepOnly(const std::function<bool(const QString &path)> &isKept)
    {
        m_probes->keepOnly(m_host.format(), isKept);
    }

    /// Begins an item, of which nothing is known yet.
    void begin() { m_item = RememberedProbe(); }
    /// What came of a sub-plug-in of the item.
    void childEnded(quint32 subId, const QString &reason, const QStringList &frames = QStringList());
    /// What came of the item. Its time counts only when it was asked: what was only looked at is looked at
    /// again at each scan.
    void end(const EffectRecord &file, const ProbeOutcome &outcome, bool isAsked);
    /// Another file than the item holds an identifier that it lists.
    void setHolder(const QString &id, const QString &holder);
    /// The same of an identifier that a file listed which was probed before.
    void setHolder(const QString &file, const QString &id, const QString &holder);
    /// Remembers the item, unless a user passed over it: what its last probe came to holds.
    void keep()
    {
        if (m_item.status != ProbeStatus::Skipped)
            m_probes->set(m_item);
    }

    /// Writes the file, failures soon, the rest now and then: what is lost with a process costs time only.
    void write(bool isLast);

private:
    const CatalogueHost &m_host;
    const std::shared_ptr<ProbeMemory> m_probes;
    RememberedProbe m_item;     ///< at hand
    QElapsedTimer m_sinceWrite; ///< invalid before the first
    qint64 m_pause = 0;         ///< ms until it may be written again
};
