#include "Main/AudioEngineController/Effects/VST3/VST3Probe.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostContext.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Buses.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ClassId.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Module.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Query.h"
#include "Main/AudioEngineController/Effects/VST3/VST3SubCategories.h"

#include <pluginterfaces/vst/ivstaudioprocessor.h>

#include <algorithm>
#include <set>

using namespace Steinberg;

namespace {

/// The records of one module's audio classes, in the factory's class order.
using ClassListing = std::vector<EffectRecord>;

/// More classes than any module has. A factory that states more is asked for this many only: two billion
/// calls for classes that do not exist take minutes.
constexpr int32 kMaxClasses = 0x10000;

/// What a factory tells of a class.
struct ClassInfo {
    bool isOrdinary = false; ///< the oldest form tells of it, if perhaps not its name
    bool isAudio = false;
    QString name;
    FUID id;
    QString subCategories; ///< not in the oldest form
    QString vendor;        ///< not in the oldest form either
};

/// An SDK structure without anything in it.
template <typename Info>
void clear(Info &info)
{
    std::memset(static_cast<void *>(&info), 0, sizeof info);
}

/// Whether a factory filled it. Some answer that they did where they did not, or the other way.
template <typename Info>
bool isFilled(const Info &info)
{
    return info.category[0] != 0;
}

template <typename Info>
void readBasics(ClassInfo &read, const Info &info)
{
    read.isAudio = std::strncmp(info.category, kVstAudioEffectClass, sizeof info.category) == 0;
    read.name = fixedText(info.name);
    read.id = FUID::fromTUID(info.cid);
}

template <typename Info>
void readDetails(ClassInfo &read, const Info &info)
{
    read.subCategories = fixedText(info.subCategories);
    read.vendor = fixedText(info.vendor);
}

ClassInfo classInfo(IPluginFactory &factory, int32 index)
{
    ClassInfo read;
    PClassInfo info;
    clear(info);
    factory.getClassInfo(index, &info);
    read.isOrdinary = isFilled(info);
    readBasics(read, info);
    return read;
}

/// Takes from a newer form what the oldest one leaves open: the class, or its name, which may have no 8-bit
/// form.
template <typename Info>
void readMissing(ClassInfo &read, const Info &info)
{
    if (!read.isOrdinary && isFilled(info))
        readBasics(read, info);
    else if (read.name.isEmpty())
        read.name = fixedText(info.name);
}

/// Asks the newer forms. An ordinary class has its details from the second; the third is asked as hosts do,
/// for a name at most. A class that the oldest form does not tell of is what the richest other one says.
void askNewerForms(ClassInfo &read, IPluginFactory &factory, int32 index)
{
    if (const FUnknownPtr<IPluginFactory2> factory2(&factory); factory2) {
        PClassInfo2 info;
        clear(info);
        factory2->getClassInfo2(index, &info);
        readMissing(read, info);
        readDetails(read, info);
    }
    if (const FUnknownPtr<IPluginFactory3> factory3(&factory); factory3) {
        PClassInfoW info;
        clear(info);
        factory3->getClassInfoUnicode(index, &info);
        readMissing(read, info);
        if (!read.isOrdinary && isFilled(info))
            readDetails(read, info);
    }
}

/// Why a factory with so many classes lists nothing.
QString noneAmong(int32 count)
{
    if (count <= 0)
        return QStringLiteral("its factory lists no classes");
    return count == 1 ? QStringLiteral("its only class is not an audio plug-in")
                      : QStringLiteral("none of its %1 classes is an audio plug-in").arg(count);
}

/// What an initialised component and the factory say of its class.
EffectRecord describe(Vst::IComponent &component, const ClassInfo &info, const QString &factoryVendor)
{
    EffectRecord record;
    record.name = info.name;
    record.inputs = usedChannels(audioBuses(component, Vst::kInput));
    record.outputs = usedChannels(audioBuses(component, Vst::kOutput));
    record.id = classIdText(info.id);
    record.categories = info.subCategories;
    record.category = categoryFromSubCategories(record.categories);
    record.vendor = info.vendor.isEmpty() ? factoryVendor : info.vendor;
    if (record.inputs == 0 && record.outputs == 0) {
        record.outputs = 2;
        record.inputs = isInstrumentCategory(record.category) ? 0 : 2;
    }
    return record;
}

/// One module while it is listed.
class ModuleListing {
public:
    ModuleListing(const QString &path, ProbeOutcome &outcome, IProbeObserver &observer)
        : m_path(path)
        , m_outcome(outcome)
        , m_observer(observer)
    {}

    /// Opens the module and lists its audio classes into `records`, which is emptied first; the module stays
    /// open. What the module throws ends the listing, and the classes listed so far stay. `factoryFound`
    /// becomes false when the module loaded but has no usable factory, and keeps the caller's value when it
    /// did not load. With `notifyEachClass`, or for a module of more than six classes, each is announced.
    void listClasses(ClassListing &records, bool notifyEachClass, bool &factoryFound);
    /// Ends and unloads the module; true when it left threads running.
    bool close() { return m_module.close(); }

private:
    void listFactory(ClassListing &records, bool notifyEachClass, bool &factoryFound);
    /// Whether it is an audio class of a name that was not met yet.
    bool isNew(const ClassInfo &info) const { return info.isAudio && m_names.count(info.name) == 0; }
    void listClass(ClassListing &records, IPluginFactory &factory, const ClassInfo &info);
    void enter(ProbeStage stage);
    void fail(const QString &reason);

    const QString m_path;
    ProbeOutcome &m_outcome;
    IProbeObserver &m_observer;
    VST3Owned<VST3HostContext> m_hostContext = VST3HostContext::createOwned(nullptr); ///< outlives the module
    VST3Module m_module{[this](ProbeStage stage) { enter(stage); }};
    QString m_factoryVendor;
    std::set<QString> m_names; ///< of the classes met so far
};

void ModuleListing::listClasses(ClassListing &records, bool notifyEachClass, bool &factoryFound)
{
    records.clear();
    try {
        if (const auto failure = m_module.open(m_path)) {
            fail(failure->reason);
            return;
        }
        factoryFound = false;
        enter(ProbeStage::Ask);
        // Not around the loading as well: what passes the system's loader ends the process.
        callTranslated([&] { listFactory(records, notifyEachClass, factoryFound); });
    } catch (...) {
        fail(thrownText());
    }
}

void ModuleListing::listFactory(ClassListing &records, bool notifyEachClass, bool &factoryFound)
{
    IPluginFactory *factory = nullptr;
    if (const auto failure = m_module.queryFactory(factory)) {
        fail(failure->reason);
        return;
    }
    factoryFound = true;
    m_factoryVendor = vendorOf(*factory);
    const int32 count = factory->countClasses();
    for (int32 index = 0; index < std::min(count, kMaxClasses); ++index) {
        ClassInfo info = classInfo(*factory, index);
        if (!info.isOrdinary || isNew(info) || (info.isAudio && info.name.isEmpty()))
            askNewerForms(info, *factory, index);
        if (!isNew(info))
            continue;
        listClass(records, *factory, info);
        if (notifyEachClass || count > kManyClasses)
            m_observer.classAnnounced();
    }
    if (records.empty())
        m_outcome.fail(noneAmong(count));
    factory->release(); // not when the plug-in threw: its state is unknown then
}

void ModuleListing::listClass(ClassListing &records, IPluginFactory &factory, const ClassInfo &info)
{
    m_names.insert(info.name);
    m_observer.classBegins(info.name);
    QString reason;
    auto *const component = createObject<Vst::IComponent>(&factory, info.id, reason);
    if (!component || !initialise(*component, m_hostContext->unknown(), reason)) {
        fail(QStringLiteral("its class \"%1\" %2").arg(info.name, reason)); // the class is left out
        return;
    }
    records.push_back(describe(*component, info, m_factoryVendor));
    component->terminate();
    component->release();
}

void ModuleListing::enter(ProbeStage stage)
{
    m_outcome.enter(stage);
    m_observer.stageEntered(stage);
}

/// The outcome holds the first reason only, and its reader logs that one. Further reasons are logged here.
void ModuleListing::fail(const QString &reason)
{
    if (!m_outcome.reason.isEmpty())
        DebugLog(L"%ls: %ls", m_path, reason);
    m_outcome.fail(reason);
}

ProbeOutcome::IfFailed ifFailed(const QString &path, bool factoryFound)
{
    // NOTE: a WaveShell finds its plug-ins in other folders, and may do so again at the next scan.
    const bool isAskedAgain = !factoryFound || path.contains(QLatin1String("WaveShell"));
    return isAskedAgain ? ProbeOutcome::IfFailed::KeepKnown : ProbeOutcome::IfFailed::Record;
}

} // namespace

std::optional<ProbeOutcome> VST3Probe::look(const ProbeJob &job) const
{
    return ProbeOutcome::ofFile(VST3Module::inspect(job.path), ifFailed(job.path, true));
}

ProbeOutcome VST3Probe::ask(const ProbeJob &job, IProbeObserver &observer)
{
    ProbeOutcome outcome;
    bool factoryFound = true;
    ModuleListing module(job.path, outcome, observer);
    module.listClasses(outcome.records, job.announceClasses, factoryFound);
    outcome.leftThreads = module.close();
    for (EffectRecord &record : outcome.records) {
        record.path = job.path;
        record.fileTime = job.fileTime;
    }
    outcome.status = outcome.records.empty() ? ProbeStatus::Failed : ProbeStatus::Listed;
    outcome.ifFailed = ifFailed(job.path, factoryFound);
    return outcome;
}
