#include "Main/AudioEngineController/Effects/VST/VSTProbe.h"

#include "Main/AudioEngineController/Effects/VST/Interface/IVSTEffectOwner.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostCallback.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostContext.h"
#include "Main/AudioEngineController/Effects/VST/VSTDescription.h"
#include "Main/AudioEngineController/Effects/VST/VSTModule.h"

#include <algorithm>
#include <atomic>

namespace {

/// Stands for the plug-in that is probed. What it reports is ignored.
class ProbedPlugin final : public IVSTEffectOwner {
public:
    explicit ProbedPlugin(const QString &path)
        : m_name(vstNameOfFile(path))
    {
        VSTHostContext::instance().registerOwner(this);
    }
    ~ProbedPlugin() { VSTHostContext::instance().unregisterOwner(this); }
    ProbedPlugin(const ProbedPlugin &) = delete;
    ProbedPlugin &operator=(const ProbedPlugin &) = delete;

    QString name() const override { return m_name; }
    VstInt32 shellId() const override { return m_shellId; }
    void setShellId(VstInt32 id) { m_shellId = id; }

private:
    const QString m_name;
    std::atomic<VstInt32> m_shellId{0}; ///< plug-ins ask for it on threads of their own
};

/// The reason for an exception that did not come from the plug-in.
QString failureOf(const std::exception &error)
{
    return QStringLiteral("asking it failed: ") + QString::fromLocal8Bit(error.what());
}

/// One run of the probe.
class Run {
public:
    Run(const ProbeJob &job, IProbeObserver &observer)
        : m_job(job)
        , m_observer(observer)
        , m_plugin(job.path)
    {}

    /// Loads the module and asks it for everything.
    void ask();
    /// Releases what is still held and unloads the module.
    void close();

    ProbeOutcome outcome;

private:
    void enterStage(ProbeStage stage);
    VSTLoadResult enter();
    void listShell(VSTEffect &shell, const EffectRecord &file);
    EffectRecord askChild(const EffectRecord &child);
    void askEffect(const EffectRecord &child);
    void closeEffect();

    const ProbeJob &m_job;
    IProbeObserver &m_observer;
    ProbedPlugin m_plugin;
    VSTModule m_module;
    std::vector<EffectRecord> m_children;
    ProbeOutcome *m_current = &outcome; ///< of the file, or of the sub-plug-in that is asked
};

void Run::enterStage(ProbeStage stage)
{
    m_current->enter(stage);
    m_observer.stageEntered(stage);
}

/// Has the module make an effect, of the plug-in or of the sub-plug-in that the host callback names.
VSTLoadResult Run::enter()
{
    if (!m_module.isLoaded())
        enterStage(ProbeStage::Load);
    VSTLoadResult result = m_module.load(m_job.path);
    if (result.isDone()) {
        enterStage(ProbeStage::Start);
        result = m_module.enter(VSTHostCallback, m_plugin);
    }
    if (result.isDone())
        enterStage(ProbeStage::Ask);
    else
        m_current->fail(result.reason);
    m_current->faulted = result.status == VSTLoadResult::Status::EntryFailed && m_module.hasFaulted();
    if (result.status == VSTLoadResult::Status::EntryFailed)
        close();
    return result;
}

void Run::ask()
{
    VSTLoadResult result = enter();
    outcome.fail(result.reason);
    if (result.status == VSTLoadResult::Status::NoEntryPoint)
        outcome.status = ProbeStatus::NoPlugin;
    if (!result.isDone())
        return;
    EffectRecord file;
    file.path = m_job.path;
    file.fileTime = m_job.fileTime;
    describeEffect(result.effect, file);
    if (file.vstCategory == kPlugCategShell)
        return listShell(result.effect, file);
    outcome.records.push_back(file);
    outcome.status = ProbeStatus::Listed;
}

void Run::listShell(VSTEffect &shell, const EffectRecord &file)
{
    for (const VSTSubPlugin &sub : subPluginsOf(shell, file.name)) {
        m_children.push_back(file);
        m_children.back().name = m_children.back().subName = sub.name;
        m_children.back().subId = sub.id;
    }
    if (m_children.empty())
        return outcome.fail(QStringLiteral("it is a shell and lists no sub-plug-ins"));
    m_observer.childrenFound(m_children.size());
    for (const EffectRecord &child : m_children)
        outcome.records.push_back(askChild(child));
    outcome.status = ProbeStatus::Listed;
}

/// The record of a sub-plug-in, which is asked unless it is to be left out.
EffectRecord Run::askChild(const EffectRecord &child)
{
    EffectRecord record = child;
    record.id.clear(); // these are the shell's
    record.inputs = record.outputs = -1;
    record.working = false;
    record.enabled = m_job.leftOut.count(child.subId) == 0;
    if (!record.enabled)
        return record;
    ProbeOutcome asked;
    asked.records.push_back(record);
    m_observer.childBegins(child);
    m_current = &asked;
    try {
        askEffect(child);
    } catch (const std::exception &error) {
        asked.fail(failureOf(error));
    }
    m_current = &outcome;
    outcome.faulted |= asked.faulted;
    m_observer.childEnds(asked);
    return asked.records.front();
}

void Run::askEffect(const EffectRecord &child)
{
    m_plugin.setShellId(static_cast<VstInt32>(child.subId));
    VSTLoadResult result = enter();
    if (!result.isDone())
        return logFailedLoad(child.path, result);
    EffectRecord record = child;
    describeEffect(result.effect, record);
    m_current->records.front() = record;
    m_current->status = ProbeStatus::Listed;
    m_current->faulted = result.effect.hasFaulted();
}

void Run::close()
{
    if (!m_module.isLoaded())
        return;
    enterStage(ProbeStage::Close);
    while (m_module.hasOpenEffect())
        closeEffect();
    const bool hasFaulted = m_module.hasFaulted();
    outcome.faulted |= hasFaulted;
    outcome.leftThreads |= !m_module.unload() && !hasFaulted;
}

void Run::closeEffect()
{
    const auto id = static_cast<quint32>(m_module.newestShellId());
    const auto child = std::find_if(m_children.begin(), m_children.end(),
                                    [id](const EffectRecord &other) { return other.subId == id; });
    if (child != m_children.end())
        m_observer.childCloses(*child);
    m_module.closeNewestEffect();
    if (child != m_children.end())
        m_observer.childClosed();
}

} // namespace

std::optional<ProbeOutcome> VSTProbe::look(const ProbeJob &job) const
{
    return ProbeOutcome::ofFile(VSTModule::inspect(job.path));
}

ProbeOutcome VSTProbe::ask(const ProbeJob &job, IProbeObserver &observer)
{
    Run run(job, observer);
    try {
        run.ask();
    } catch (const std::exception &error) {
        run.outcome.fail(failureOf(error));
    }
    run.close();
    return run.outcome;
}
