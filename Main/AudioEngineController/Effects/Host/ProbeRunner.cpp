#include "Main/AudioEngineController/Effects/Host/ProbeRunner.h"

#include "Core/BaseLib/Process/PluginThread.h"

#include <QCoreApplication>

namespace {

double milliseconds(const QElapsedTimer &timer) { return static_cast<double>(timer.nsecsElapsed()) / 1e6; }

} // namespace

ProbeRunner::ProbeRunner(const CatalogueHost &host)
    : m_host(host)
    , m_probe(host.makeProbe())
{}

ProbeOutcome ProbeRunner::run(const ProbeJob &job, IProbeObserver &observer)
{
    m_job = &job;
    m_observer = &observer;
    QElapsedTimer timer;
    timer.start();
    ProbeOutcome outcome = m_probe->run(job, *this);
    if (!m_marker.path().isEmpty())
        settle();
    outcome.milliseconds = milliseconds(timer);
    m_marker.remove();
    return outcome;
}

/// Whatever a plug-in left behind leads into its code, or spoils the next one's probe: it is dealt with while
/// the marker still stands.
void ProbeRunner::settle() const
{
    QCoreApplication::processEvents();
    PluginThread::deliverMessages();
    m_processState.restore();
}

void ProbeRunner::stageEntered(ProbeStage stage)
{
    // The first stage of all: now the plug-in is touched. A file that is seen not to be one needs no marker.
    if (m_marker.path().isEmpty()) {
        EffectRecord file;
        file.path = m_job->path;
        file.fileTime = m_job->fileTime;
        m_marker = m_host.WriteCrashMarker(file);
    }
    m_observer->stageEntered(stage);
}

void ProbeRunner::classBegins(const QString &name)
{
    m_marker.refresh();
    m_observer->classBegins(name);
}

void ProbeRunner::childBegins(const EffectRecord &child)
{
    m_observer->childBegins(child);
    m_childTimer.start();
    m_childMarker = m_host.WriteCrashMarker(child, child.subName);
}

void ProbeRunner::childEnds(const ProbeOutcome &outcome)
{
    endChild();
    ProbeOutcome timed = outcome;
    timed.milliseconds = milliseconds(m_childTimer);
    m_observer->childEnds(timed);
}

void ProbeRunner::childCloses(const EffectRecord &child)
{
    m_childMarker = m_host.WriteCrashMarker(child, child.subName);
    m_observer->childCloses(child);
}

void ProbeRunner::childClosed()
{
    endChild();
    m_observer->childClosed();
}

void ProbeRunner::endChild()
{
    settle();
    m_childMarker.remove();
    m_marker.refresh(); // a shell with many goes on
}
