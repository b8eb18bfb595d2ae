#include "Main/AudioEngineController/Effects/VST3/VST3Plugin.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/FaultGuard.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Buses.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ClassId.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Query.h"
#include "Main/AudioEngineController/Effects/VST3/VST3SubCategories.h"
#include "Main/VLib/SimpleGUI.h"

#include <algorithm>
#include <cstring>
#include <set>
#include <stdexcept>

using namespace Steinberg;

namespace {

constexpr char kAudioModuleClass[] = "Audio Module Class"; // kVstAudioEffectClass of the SDK
/// Modules of more classes than this report each one as it is listed.
constexpr int32 kManyClasses = 6;
/// More classes than any module has. A factory that states more is only asked for these: two thousand million
/// calls for classes that do not exist take minutes.
constexpr int32 kMaxClasses = 0x10000;

/// What the factory's newer interfaces tell about a class; zeroed where the factory lacks them.
PClassInfo2 classDetails(IPluginFactory *factory, int32 index)
{
    PClassInfo2 details;
    std::memset(static_cast<void *>(&details), 0, sizeof details);
    if (const IPtr<IPluginFactory2> factory2 = queryFor<IPluginFactory2>(factory))
        factory2->getClassInfo2(index, &details);
    if (const IPtr<IPluginFactory3> factory3 = queryFor<IPluginFactory3>(factory)) {
        PClassInfoW unicode; // fetched as hosts do, and not used
        std::memset(static_cast<void *>(&unicode), 0, sizeof unicode);
        factory3->getClassInfoUnicode(index, &unicode);
    }
    return details;
}

} // namespace

/// A factory while its classes are listed.
struct VST3Plugin::FactoryView {
    IPluginFactory *factory;
    QString vendor;
    std::set<QString> names; ///< of the classes met so far
};

VST3Plugin::VST3Plugin()
    : m_hostContext(VST3HostContext::createOwned(nullptr))
{}

VST3Plugin::~VST3Plugin() { unload(); }

void VST3Plugin::listClasses(ClassListing &records, const QString &path, bool notifyEachClass,
                             bool &factoryFound)
{
    try {
        openAndList(records, path, notifyEachClass, factoryFound);
    } catch (const std::exception &error) {
        DebugLog(L"%ls: %s", path, error.what());
        ProbeReport::reason(QStringLiteral("it threw: ") + QString::fromUtf8(error.what()));
    } catch (...) {
        DebugLog(L"%ls: the plug-in threw something that is no standard exception", path);
        ProbeReport::reason(QStringLiteral("it threw something that is no standard exception"));
    }
}

void VST3Plugin::openAndList(ClassListing &records, const QString &path, bool notifyEachClass,
                             bool &factoryFound)
{
    records.clear();
    openModule(path);
    factoryFound = false;
    ProbeReport::stage(ProbeStage::Ask);
    // Not around the loading as well: what passes the system's loader ends the process.
    callTranslated([&] { listModule(records, notifyEachClass, factoryFound); });
}

void VST3Plugin::listModule(ClassListing &records, bool notifyEachClass, bool &factoryFound)
{
    IPluginFactory *const factory = queryFactory();
    factoryFound = true;
    listFactory(records, factory, notifyEachClass);
}

void VST3Plugin::openModule(const QString &path)
{
    if (!m_module.open(path))
        throw std::runtime_error("VST3 Exception: Failed to get load module:" + path.toStdString());
}

IPluginFactory *VST3Plugin::queryFactory()
{
    IPluginFactory *const module = m_module.factory();
    void *factory = nullptr;
    if (!module || module->queryInterface(IPluginFactory::iid, &factory) != kResultOk || !factory) {
        ProbeReport::reason(m_module.exportsFactory() ? QStringLiteral("it gives no plug-in factory")
                                                      : QStringLiteral("it exports no \"GetPluginFactory\""));
        throw std::runtime_error("VST3 Exception: Failed to get factory function");
    }
    return static_cast<IPluginFactory *>(factory);
}

void VST3Plugin::listFactory(ClassListing &records, IPluginFactory *factory, bool notifyEachClass)
{
    FactoryView view{factory, vendorOf(*factory), {}};
    const int32 count = factory->countClasses();
    const std::size_t before = records.size();
    for (int32 index = 0; index < std::min(count, kMaxClasses); ++index)
        listClass(records, view, index, notifyEachClass || count > kManyClasses);
    if (records.size() == before) {
        DebugLog(L"No audio class could be listed, of %d classes", count);
        ProbeReport::reason(QStringLiteral("it lists no audio plug-in, of %1 classes").arg(count));
    }
    // Not released when the plug-in threw: its state is unknown then.
    factory->release();
}

void VST3Plugin::listClass(ClassListing &records, FactoryView &view, int32 index, bool notify)
{
    PClassInfo info;
    std::memset(static_cast<void *>(&info), 0, sizeof info);
    view.factory->getClassInfo(index, &info);
    if (std::strncmp(info.category, kAudioModuleClass, sizeof info.category) != 0)
        return;
    const QString name = fixedText(info.name);
    if (view.names.count(name) != 0)
        return;
    const PClassInfo2 details = classDetails(view.factory, index);
    m_classId = FUID::fromTUID(info.cid);
    view.names.insert(name);
    if (m_classObserver)
        m_classObserver();
    showScanning(name);
    instantiate(records, view, name, details);
    if (notify)
        notifyUI(MessageCode::kEntryAdded);
}

void VST3Plugin::instantiate(ClassListing &records, const FactoryView &view, const QString &name,
                             const PClassInfo2 &details)
{
    m_component = nullptr;
    void *component = nullptr;
    const tresult created =
        view.factory->createInstance(m_classId.toTUID(), Vst::IComponent::iid, &component);
    if (created != kResultOk || !component) {
        DebugLog(L"The class %ls could not be created: 0x%08X", name, created);
        ProbeReport::reason(
            formatText(L"its class \"%ls\" could not be created (result 0x%08X)", name, created));
        return;
    }
    m_component = static_cast<Vst::IComponent *>(component);
    const tresult initialised = m_component->initialize(m_hostContext->unknown());
    if (initialised != kResultOk) {
        // Neither terminated nor released: a component that could not start is not called again.
        DebugLog(L"The class %ls could not be initialised: 0x%08X", name, initialised);
        ProbeReport::reason(
            formatText(L"its class \"%ls\" could not be initialised (result 0x%08X)", name, initialised));
        return;
    }
    records.push_back(describe(view, name, details));
    m_component->terminate();
    m_component->release();
    m_component = nullptr;
}

EffectRecord VST3Plugin::describe(const FactoryView &view, const QString &name,
                                  const PClassInfo2 &details) const
{
    EffectRecord record;
    record.name = name;
    record.inputs = usedChannels(audioBuses(*m_component, Vst::kInput));
    record.outputs = usedChannels(audioBuses(*m_component, Vst::kOutput));
    record.id = classIdText(m_classId);
    record.categories = fixedText(details.subCategories);
    record.category = categoryFromSubCategories(record.categories);
    record.vendor = fixedText(details.vendor);
    if (record.vendor.isEmpty())
        record.vendor = view.vendor;
    if (record.inputs == 0 && record.outputs == 0) {
        record.outputs = 2;
        record.inputs = isInstrumentCategory(record.category) ? 0 : 2;
    }
    return record;
}
