#include "Main/AudioEngineController/Effects/CLAP/CLAPProbe.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/FaultGuard.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPFeatures.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPHostContext.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPInterface.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPModule.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPPorts.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPText.h"

#include <algorithm>
#include <set>

namespace {

/// More plug-ins than any module has. A factory that states more is asked for this many only: four billion
/// calls for descriptors that do not exist take minutes.
constexpr uint32_t kMaxPlugins = 0x10000;

/// One module while it is listed.
class ModuleListing {
public:
    ModuleListing(const ProbeJob &job, IProbeObserver &observer)
        : m_job(job)
        , m_observer(observer)
    {}

    /// Opens the module and lists its plug-ins; it stays open.
    void list();
    /// Ends and unloads the module.
    void close() { outcome.leftThreads = m_module.close(); }

    ProbeOutcome outcome;

private:
    void listFactory();
    void listPlugin(const clap_plugin_factory &factory, const clap_plugin_descriptor &descriptor);
    void ask(const clap_plugin_factory &factory, const char *id, EffectRecord &record, QString &reason);
    void enter(ProbeStage stage);
    void fail(const QString &reason);

    const ProbeJob &m_job;
    IProbeObserver &m_observer;
    const clap_host &m_host = newClapHost(m_job.path);
    CLAPModule m_module{[this](ProbeStage stage) { enter(stage); }};
    std::set<QString> m_ids; ///< of the plug-ins met so far
};

void ModuleListing::list()
{
    try {
        if (const QString reason = m_module.open(m_job.path); !reason.isEmpty())
            return fail(reason);
        enter(ProbeStage::Ask);
        outcome.ifFailed = ProbeOutcome::IfFailed::KeepKnown; // until there is a factory
        callTranslated([this] { listFactory(); });
    } catch (...) {
        fail(thrownText());
    }
}

void ModuleListing::listFactory()
{
    QString reason;
    const clap_plugin_factory *const factory = m_module.factory(reason);
    if (!factory)
        return fail(reason);
    outcome.ifFailed = ProbeOutcome::IfFailed::Record;
    const uint32_t count = factory->get_plugin_count(factory);
    for (uint32_t index = 0; index < std::min(count, kMaxPlugins); ++index) {
        const clap_plugin_descriptor *const descriptor = factory->get_plugin_descriptor(factory, index);
        if (!descriptor || !clap_version_is_compatible(descriptor->clap_version))
            continue;
        const QString id = clapText(descriptor->id);
        if (id.isEmpty())
            fail(QStringLiteral("its plug-in \"%1\" has no identifier").arg(clapText(descriptor->name)));
        else if (m_ids.insert(id).second)
            listPlugin(*factory, *descriptor);
        else
            continue;
        if (m_job.announceClasses || count > kManyClasses)
            m_observer.classAnnounced();
    }
    if (outcome.records.empty())
        outcome.fail(count == 0 ? QStringLiteral("its factory lists no plug-ins")
                                : QStringLiteral("none of its plug-ins has a descriptor that can be used"));
}

void ModuleListing::listPlugin(const clap_plugin_factory &factory, const clap_plugin_descriptor &descriptor)
{
    EffectRecord record;
    record.path = m_job.path;
    record.fileTime = m_job.fileTime;
    record.id = clapText(descriptor.id);
    record.name = clapText(descriptor.name);
    if (record.name.isEmpty())
        record.name = record.id;
    m_observer.classBegins(record.name);
    record.vendor = clapText(descriptor.vendor);
    record.version = clapText(descriptor.version);
    const QStringList features = clapFeatures(descriptor.features);
    record.categories = features.join(QLatin1Char('|'));
    record.category = categoryFromFeatures(features);
    QString reason;
    ask(factory, descriptor.id, record, reason);
    if (!reason.isEmpty()) // it is left out
        fail(QStringLiteral("its plug-in \"%1\" %2").arg(record.name, reason));
}

/// Makes an instance, which tells the rest of the record, and destroys it again.
void ModuleListing::ask(const clap_plugin_factory &factory, const char *id, EffectRecord &record,
                        QString &reason)
{
    const clap_plugin *const plugin = factory.create_plugin(&factory, &m_host, id);
    if (!plugin || !plugin->init || !plugin->destroy || !plugin->get_extension) {
        reason = plugin ? QStringLiteral("lacks a function") : QStringLiteral("could not be created");
        return;
    }
    if (plugin->init(plugin)) {
        const CLAPChannels channels = channelsOf(*plugin);
        record.inputs = channels.inputs;
        record.outputs = channels.outputs;
        outcome.records.push_back(record);
    } else {
        reason = QStringLiteral("could not be initialised");
    }
    plugin->destroy(plugin);
}

void ModuleListing::enter(ProbeStage stage)
{
    outcome.enter(stage);
    m_observer.stageEntered(stage);
}

/// The outcome holds the first reason only, and its reader logs that one. Further reasons are logged here.
void ModuleListing::fail(const QString &reason)
{
    if (!outcome.reason.isEmpty())
        DebugLog(L"%ls: %ls", m_job.path, reason);
    outcome.fail(reason);
}

} // namespace

std::optional<ProbeOutcome> CLAPProbe::look(const ProbeJob &job) const
{
    return ProbeOutcome::ofFile(CLAPModule::inspect(job.path));
}

ProbeOutcome CLAPProbe::ask(const ProbeJob &job, IProbeObserver &observer)
{
    ModuleListing module(job, observer);
    module.list();
    module.close();
    if (!module.outcome.records.empty())
        module.outcome.status = ProbeStatus::Listed;
    return module.outcome;
}
