#include "Scanner/ProbeWorker.h"

#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Core/BaseLib/Process/CrashReport.h"
#include "Core/BaseLib/Process/PluginThread.h"
#include "Core/BaseLib/Process/ProcessSetup.h"
#include "Core/BaseLib/Process/ProcessState.h"
#include "Core/BaseLib/Process/WorkerGroup.h"
#include "Core/BaseLib/WorkstationServices/AudioPlugins.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeChannel.h"

#include <QCoreApplication>
#include <QElapsedTimer>

namespace {

using Kind = ChannelMessage::Kind;

double milliseconds(const QElapsedTimer &timer) { return static_cast<double>(timer.nsecsElapsed()) / 1e6; }

/// Tells the scanner what a probe does next, before the plug-in is called.
class Teller : public IProbeObserver {
public:
    Teller(WorkerChannel &channel, const ProcessState &state)
        : m_channel(channel)
        , m_state(state)
    {}

    void tell(const ChannelMessage &message)
    {
        if (!m_channel.write(encodeMessage(message)))
            leaveProcess(kChannelLost);
    }
    void tell(Kind kind)
    {
        ChannelMessage message;
        message.kind = kind;
        tell(message);
    }

    void stageEntered(ProbeStage stage) override
    {
        ChannelMessage message;
        message.kind = Kind::Stage;
        message.stage = stage;
        tell(message);
    }
    void classBegins(const QString &name) override
    {
        ChannelMessage message;
        message.kind = Kind::Class;
        message.text = name;
        tell(message);
    }
    void classAnnounced() override { tell(Kind::Announced); }
    void childrenFound(std::size_t count) override
    {
        ChannelMessage message;
        message.kind = Kind::Children;
        message.number = static_cast<quint32>(count);
        tell(message);
    }
    void childBegins(const EffectRecord &child) override
    {
        m_childTimer.start();
        tellRecord(Kind::Child, child);
    }
    void childEnds(const ProbeOutcome &outcome) override
    {
        settle();
        ChannelMessage message;
        message.kind = Kind::ChildEnd;
        message.outcome = outcome;
        message.outcome.milliseconds = milliseconds(m_childTimer);
        if (!outcome.records.empty())
            message.record = outcome.records.front();
        tell(message);
    }
    void childCloses(const EffectRecord &child) override { tellRecord(Kind::ChildCloses, child); }
    void childClosed() override
    {
        settle();
        tell(Kind::ChildClosed);
    }

    void tellRecord(Kind kind, const EffectRecord &record)
    {
        ChannelMessage message;
        message.kind = kind;
        message.record = record;
        tell(message);
    }
    /// What a plug-in left behind leads into its code, or spoils the next one's probe.
    void settle() const
    {
        QCoreApplication::processEvents();
        PluginThread::deliverMessages();
        m_state.restore();
    }

private:
    WorkerChannel &m_channel;
    const ProcessState &m_state;
    QElapsedTimer m_childTimer;
};

void work(const ProbeJob &job, Teller &teller)
{
    QElapsedTimer timer;
    timer.start();
    CrashReport::setPlugin(job.path);
    const std::unique_ptr<IPluginProbe> probe = PluginHost::instance().host(job.format).makeProbe();
    ChannelMessage done;
    done.kind = Kind::Done;
    ProbeJob loadable = job;
    loadable.isLookedAt = true;
    if (probe)
        done.outcome = probe->run(loadable, teller);
    teller.settle();
    done.outcome.leftModule = PluginLibrary::isMapped(job.path);
    for (const EffectRecord &record : done.outcome.records)
        teller.tellRecord(Kind::Record, record);
    done.outcome.records.clear();
    done.outcome.milliseconds = milliseconds(timer);
    teller.tell(done);
}

} // namespace

int runProbeWorker()
{
    if (!WorkerChannel::isThere())
        return 1;
    WorkerChannel channel;
    const PluginThread thread;
    AudioPlugins::setRegistry(&PluginHost::instance());
    CrashReport::install();
    const ProcessState state; // after it: what plug-ins change comes back to this
    Teller teller(channel, state);
    teller.tell(Kind::Ready);
    ChannelReader reader;
    for (QByteArray bytes = channel.read(); !bytes.isEmpty(); bytes = channel.read()) {
        reader.feed(bytes);
        while (const std::optional<ChannelMessage> message = reader.next())
            if (message->kind == Kind::Job)
                work(message->job, teller);
    }
    return 0;
}
