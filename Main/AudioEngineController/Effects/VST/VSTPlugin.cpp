#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/FaultGuard.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginIdentifier.h"
#include "Main/AudioEngineController/Effects/Plugin/PluginBehaviour.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTHostCallback.h"

#include <algorithm>
#include <set>

namespace {

constexpr int kNameSize = 1024;
constexpr int kVendorSize = 256;
constexpr int kMaxKey = 255; ///< UTF-16 units

using EntryPoint = AEffect *(*)(VSTHostCallbackFunction);

/// Plug-in text is widened character by character, as unsigned bytes.
QString widen(const QByteArray &text) { return QString::fromLatin1(text); }

QString nameOfFile(const QString &path)
{
    const int slash = path.lastIndexOf(QLatin1Char('/'));
    return slash < 0 ? QString() : path.mid(slash + 1).section(QLatin1Char('.'), 0, 0);
}

/// While it lives, the host callback answers calls from inside an entry point for this plug-in.
class Loading {
public:
    Loading(VSTHost &host, VSTPlugin *plugin)
        : m_host(host)
    {
        m_host.setPluginBeingLoaded(plugin);
    }
    ~Loading() { m_host.setPluginBeingLoaded(nullptr); }
    Loading(const Loading &) = delete;
    Loading &operator=(const Loading &) = delete;

private:
    VSTHost &m_host;
};

} // namespace

VSTPlugin::VSTPlugin(VSTHost &host)
    : m_host(host)
{
    m_host.registerPlugin(this);
}

VSTPlugin::~VSTPlugin()
{
    setTornDown(true);
    unload();
    m_host.stopIgnoring(this); // another object may get this address
    m_host.unregisterPlugin(this);
}

QString VSTPlugin::identifierPrefix() const { return QString::fromLatin1(PluginPrefix::kVst2); }

bool VSTPlugin::load(const QString &path, VSTHostCallbackFunction callback, bool &isPluginModule)
{
    const VSTEffect effect = callEntryPoint(path, callback, isPluginModule);
    if (!isUsable(effect) || !adopt(effect, path))
        return false;
    m_isProbe = true;
    return true;
}

bool VSTPlugin::load(const EffectRecord &record, VSTHostCallbackFunction callback, int reloadMode)
{
    if (reloadMode == 1)
        m_isProbe = false;
    if (reloadMode == 0) {
        setTornDown(true);
        unload();
        setTornDown(false);
    }
    m_shellId = static_cast<VstInt32>(record.subId);
    VSTEffect effect;
    {
        const Loading loading(m_host, this);
        bool isPluginModule = true;
        effect = callEntryPoint(record.path, callback, isPluginModule);
    }
    if (isUsable(effect) && adopt(effect, record.path))
        return true;
    if (effect.isHeld() && !effect.isEffect())
        DebugLog(L"VSTPlugin::Load - Invalid VST Plugin");
    DebugLog(L"VSTPlugin::Load - Failed to Load DLL: %s", record.path);
    return false;
}

bool VSTPlugin::isUsable(const VSTEffect &effect)
{
    if (effect.isEffect())
        return true;
    ProbeReport::reason(effect.isHeld() ? QStringLiteral("what its entry point gives is no VST 2 plug-in")
                                        : QStringLiteral("its entry point gives no plug-in"));
    return false;
}

VSTEffect VSTPlugin::callEntryPoint(const QString &path, VSTHostCallbackFunction callback,
                                    bool &isPluginModule)
{
    isPluginModule = true;
    if (!m_library.isLoaded())
        ProbeReport::stage(ProbeStage::Load);
    if (!m_library.isLoaded() && !m_library.load(path)) {
        DebugLog(L"Cannot load the module %ls: %ls", path, m_library.errorText());
        ProbeReport::reason(QStringLiteral("it could not be loaded: ") + m_library.errorText());
        return VSTEffect();
    }
    m_loaded = true;
    void *entryPoint = m_library.symbol("VSTPluginMain");
    if (!entryPoint)
        entryPoint = m_library.symbol("main");
    if (!entryPoint) {
        isPluginModule = false;
        DebugLog(L"The module %ls exports neither 'VSTPluginMain' nor 'main'", path);
        ProbeReport::reason(QStringLiteral("it exports no VST 2 entry point"));
        return VSTEffect();
    }
    return VSTEffect(enter(entryPoint, callback));
}

AEffect *VSTPlugin::enter(void *entryPoint, VSTHostCallbackFunction callback)
{
    ProbeReport::stage(ProbeStage::Start);
    const VSTCallbackNesting::Restore nesting;
    try {
        return callGuarded([&] { return reinterpret_cast<EntryPoint>(entryPoint)(callback); });
    } catch (const SEException &fault) {
        m_faulted = true;
        DebugLog(L"VST plug-in entry point: %s", fault.what());
        ProbeReport::reason(QStringLiteral("its entry point failed: ") + QString::fromLatin1(fault.what()));
    } catch (const std::exception &exception) {
        const QString text = guardedText(exception);
        DebugLog(L"VST plug-in entry point threw: %ls", text);
        ProbeReport::reason(QStringLiteral("its entry point threw: ") + text);
    } catch (...) {
        DebugLog(L"VST plug-in entry point threw something that is no standard exception");
        ProbeReport::reason(QStringLiteral("its entry point threw something that is no standard exception"));
    }
    unload();
    return nullptr;
}

bool VSTPlugin::adopt(const VSTEffect &effect, const QString &path)
{
    m_faulted |= m_effect.hasFaulted();
    {
        const TAutoLockCS lock(&processingLock()); // a thread of the plug-in may have its channels rebuilt
        m_effect = effect;
        m_effectOpened = m_canBypass = m_takesMidi = false;
        m_needsIdle = m_wantsMidi = m_ioChanged = false; // of the effect before
        m_speakersPending = true;
    }
    ProbeReport::stage(ProbeStage::Ask);
    const auto isSame = [&](const HandedOut &other) { return other.effect.isSame(effect); };
    if (std::none_of(m_handedOut.begin(), m_handedOut.end(), isSame))
        m_handedOut.push_back({effect, m_shellId});
    try {
        m_effect.setOwner(this);
    } catch (const SEException &fault) {
        m_faulted = true;
        DebugLog(L"The effect of %ls cannot be written to: %s", path, fault.what());
        ProbeReport::reason(QStringLiteral("what its entry point gives is no VST 2 plug-in"));
        return false;
    }
    m_fields = m_effect.fields().value_or(VSTEffect::Fields{});
    nameFrom(path);
    return true;
}

bool VSTPlugin::asksForName()
{
    if (m_fields.numInputs == 0)
        return m_shellId != 0;
    const VstIntPtr category = m_effect.dispatch(effGetPlugCategory);
    return category != kPlugCategSynth || m_shellId != 0;
}

void VSTPlugin::nameFrom(const QString &path)
{
    m_name = nameOfFile(path);
    if (asksForName()) {
        const VSTEffect::Text text = m_effect.dispatchText(effGetEffectName, kNameSize);
        if (text.answer != 0 || !text.bytes.isEmpty())
            m_name = widen(text.bytes);
    }
    m_key = cutText(formatText(L"%ls:%ld", m_name, static_cast<long>(m_fields.uniqueID)), kMaxKey);
    m_behaviour = PluginBehaviour::lookUp(QStringLiteral("vst"), m_key);
}

VstInt32 VSTPlugin::statedCategory()
{
    if (m_fields.numInputs == 0 || PluginBehaviour::isInstrument(m_behaviour))
        return kPlugCategSynth;
    return static_cast<VstInt32>(m_effect.dispatch(effGetPlugCategory));
}

void VSTPlugin::readInto(EffectRecord &record)
{
    record.vstCategory = statedCategory();
    m_fields = m_effect.fields().value_or(m_fields); // the calls may have changed them
    record.behaviour = m_behaviour;
    record.vendor = widen(m_effect.dispatchText(effGetVendorString, kVendorSize).bytes);
    record.width = m_fields.numOutputs;
    record.latency = m_fields.initialDelay;
    record.name = m_name;
    record.id = m_key;
}

std::vector<VSTSubPlugin> VSTPlugin::subPlugins()
{
    std::vector<VSTSubPlugin> found;
    std::set<quint32> ids;
    for (int count = 0; count < kMaxSubPlugins; ++count) {
        const VSTEffect::Text next = m_effect.dispatchText(effShellGetNextPlugin, kNameSize);
        const auto id = static_cast<quint32>(next.answer);
        if (id == 0)
            return found;
        if (ids.insert(id).second)
            found.push_back({id, widen(next.bytes)});
    }
    DebugLog(L"The shell %ls names more than %d sub-plug-ins; the rest is left out", m_name, kMaxSubPlugins);
    return found;
}

void VSTPlugin::closeEffects()
{
    std::vector<HandedOut> effects;
    effects.swap(m_handedOut);
    m_faulted |= m_effect.hasFaulted();
    {
        const TAutoLockCS lock(&processingLock());
        m_effect = VSTEffect();
    }
    for (auto entry = effects.rbegin(); entry != effects.rend() && !m_faulted; ++entry) {
        const bool isBracketed = m_closeBracket && entry->shellId != 0;
        const std::shared_ptr<void> bracket = isBracketed ? m_closeBracket(entry->shellId) : nullptr;
        entry->effect.dispatch(effClose);
        m_faulted |= entry->effect.hasFaulted();
    }
}

void VSTPlugin::unload()
{
    if (!m_loaded)
        return;
    ProbeReport::stage(ProbeStage::Close);
    VSTPlugin::close();
    closeEffects();
    if (m_faulted)
        m_library.leaveMapped(); // it may hold locks and own threads
    else
        m_library.freeUnlessRunning();
    m_loaded = false;
    m_faulted = false; // the next module is another
}
