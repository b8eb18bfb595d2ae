#pragma once

#include "Core/BaseLib/Process/ProcessState.h"
#include "Main/AudioEngineController/Effects/Host/CatalogueHost.h"

#include <QElapsedTimer>

/// Makes outcomes of jobs in this process. A plug-in's crash marker is on disk from before it is touched
/// until it was unloaded, and what it changed for the whole process is put back. Lives on the scan worker.
class ProbeRunner : private IProbeObserver {
public:
    explicit ProbeRunner(const CatalogueHost &host);

    /// Probes; `observer` hears of each step when its marker is on disk, and of an end before the marker is
    /// deleted.
    ProbeOutcome run(const ProbeJob &job, IProbeObserver &observer);

private:
    void stageEntered(ProbeStage stage) override;
    void classBegins(const QString &name) override;
    void classAnnounced() override { m_observer->classAnnounced(); }
    void childrenFound(std::size_t count) override { m_observer->childrenFound(count); }
    void childBegins(const EffectRecord &child) override;
    void childEnds(const ProbeOutcome &outcome) override;
    void childCloses(const EffectRecord &child) override;
    void childClosed() override;
    void endChild();
    void settle() const;

    const CatalogueHost &m_host;
    const std::unique_ptr<IPluginProbe> m_probe;
    ProcessState m_processState;
    IProbeObserver *m_observer = nullptr; ///< while a job runs
    const ProbeJob *m_job = nullptr;      ///< while it runs
    CrashMarker m_marker;
    CrashMarker m_childMarker;
    QElapsedTimer m_childTimer;
};
