#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/FaultGuard.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginIdentifier.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ClassId.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Plugin.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Query.h"
#include "Main/VLib/SimpleGUI.h"

#include <stdexcept>

// One instance of a class, in use. Listing the classes of a module does none of this.

using namespace Steinberg;

namespace {

/// What a plug-in may change with a call to its handler, by how it is followed.
constexpr int32 kRebuilding = Vst::kReloadComponent | Vst::kIoChanged | Vst::kLatencyChanged;
constexpr int32 kShowing = Vst::kParamValuesChanged | Vst::kParamTitlesChanged;

} // namespace

QString VST3Plugin::identifierPrefix() const { return QString::fromLatin1(PluginPrefix::kVst3); }

bool VST3Plugin::openClass(const EffectRecord &record)
{
    try {
        return openInstance(record);
    } catch (const std::runtime_error &error) {
        DebugLog(L"%s", error.what());
    } catch (...) {
        m_instance.close();
        throw;
    }
    m_instance.close(); // what threw on the way is no instance
    return false;
}

bool VST3Plugin::openInstance(const EffectRecord &record)
{
    unload();
    setTornDown(false);
    m_hostContext = VST3HostContext::createOwned(static_cast<IVST3EditOwner *>(this));
    openModule(record.path);
    m_classId = classIdOf(record.id);
    if (!m_classId.isValid())
        DebugLog(L"'%ls' is no class identifier", record.id);
    // Not around the loading as well: what passes the system's loader ends the process.
    return callTranslated([&] { return instantiate(record); });
}

bool VST3Plugin::instantiate(const EffectRecord &record)
{
    IPluginFactory *const factory = queryFactory();
    const bool created = m_classId.isValid() && m_instance.create(factory, m_classId, *m_hostContext);
    if (created) {
        m_record = record;
        if (m_record.vendor.isEmpty())
            m_record.vendor = vendorOf(*factory);
    }
    factory->release(); // not when the plug-in threw, as for a listing
    return created;
}

void VST3Plugin::unload()
{
    setTornDown(true);
    AudioPlugin::close();
    callPlugin("close", [this] {
        m_processor.detach();
        return true;
    });
    m_instance.close();
    m_module.close();
}

/// Makes a call into the plug-in; what it throws is logged and counts as a refusal.
template <typename Call>
bool VST3Plugin::callPlugin(const char *what, Call &&call)
{
    try {
        return callTranslated(call);
    } catch (const std::exception &error) {
        DebugLog(L"%ls: to %s it, the plug-in threw: %s", m_record.name, what, error.what());
    } catch (...) {
        DebugLog(L"%ls: to %s it, the plug-in threw something that is no standard exception", m_record.name,
                 what);
    }
    return false;
}

bool VST3Plugin::openPlugin(const AudioSettings &settings)
{
    const bool hasAudio =
        isInstantiated() && callPlugin("open", [this] { return m_processor.attach(m_instance.component()); });
    if (!hasAudio)
        DebugLog(L"%ls has no audio side that can be used", m_record.name);
    return hasAudio && applySettings(settings);
}

bool VST3Plugin::applySettings(const AudioSettings &settings)
{
    return callPlugin("set up", [&] { return m_processor.setUp(settings.sampleRate, settings.blockSize); });
}

bool VST3Plugin::setBusFormats(int inputFormat, int outputFormat)
{
    const TAutoLockCS lock(&processingLock());
    if (!isOpen())
        return false;
    const bool wasRunning = isRunning();
    stop();
    const bool accepted = callPlugin("set the buses of", [&] {
        return m_processor.setFormats({inputFormat, outputFormat}, m_settings);
    });
    rebuildChannels();
    return (!wasRunning || start()) && accepted;
}

bool VST3Plugin::startProcessing()
{
    const bool started = callPlugin("start", [this] { return m_processor.start(); });
    if (!started)
        deactivate();
    return started;
}

void VST3Plugin::stopProcessing()
{
    callPlugin("stop", [this] {
        m_processor.stop();
        return true;
    });
    deactivate();
}

void VST3Plugin::deactivate()
{
    callPlugin("deactivate", [this] {
        m_processor.deactivate();
        return true;
    });
}

ChannelSetup VST3Plugin::readChannels()
{
    ChannelSetup channels;
    callPlugin("count the channels of", [&] {
        channels = m_processor.readChannels();
        return true;
    });
    return channels;
}

bool VST3Plugin::processBlock(ChannelBuffers &buffers, int frames)
{
    return callPlugin("process with", [&] { return m_processor.process(buffers, frames); });
}

bool VST3Plugin::StorePreset(PluginPreset &preset)
{
    showStatusWithLevel(MessageCode::kScanning, L"Storing %s Preset", m_record.name);
    PluginPreset captured;
    callPlugin("store", [&] {
        captured.data = m_instance.state();
        return true;
    });
    const bool stored = !captured.data.isEmpty();
    if (stored) {
        captured.isChunk = 1;
        captured.identifier = identifier();
        captured.name = m_record.name.toLatin1();
        storeSettings(captured);
        preset = captured;
    }
    showStatusWithLevel(MessageCode::kCompleted, L"");
    return stored;
}

bool VST3Plugin::LoadPreset(const PluginPreset &preset)
{
    showStatusWithLevel(MessageCode::kScanning, L"Loading %s Preset", m_record.name);
    bool loaded = false;
    if (preset.identifier != identifier() || preset.isChunk != 1)
        DebugLog(L"The preset cannot be loaded into %ls: it is of %ls", m_record.name, preset.identifier);
    else
        loaded = callPlugin("load", [&] { return m_instance.setState(preset.data); });
    if (loaded) {
        loadSettings(preset);
        tellListeners([this](IAudioPluginListener &listener) { listener.pluginChanged(*this); });
    }
    showStatusWithLevel(MessageCode::kCompleted, L"");
    return loaded;
}

tresult VST3Plugin::editGesture(Vst::ParamID id, bool begun) noexcept
{
    tellListeners([&](IAudioPluginListener &listener) { listener.parameterEdit(*this, id, begun); });
    return kResultOk;
}

tresult VST3Plugin::performEdit(Vst::ParamID id, Vst::ParamValue value) noexcept
{
    tellListeners([&](IAudioPluginListener &listener) { listener.parameterChanged(*this, id, value); });
    return kResultOk;
}

tresult VST3Plugin::restartComponent(int32 flags) noexcept
{
    if (flags & kRebuilding)
        rebuildChannels();
    if (flags & kShowing)
        tellListeners([this](IAudioPluginListener &listener) { listener.displayChanged(*this); });
    return kResultOk;
}
