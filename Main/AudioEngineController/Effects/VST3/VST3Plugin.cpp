#include "Main/AudioEngineController/Effects/VST3/VST3Plugin.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/FaultGuard.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ClassId.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Query.h"
#include "Main/VLib/SimpleGUI.h"

#include <QScopeGuard>

#include <stdexcept>

using namespace Steinberg;

namespace {

/// What a plug-in may change with a call to its handler, by how it is followed.
constexpr int32 kRebuilding = Vst::kReloadComponent | Vst::kIoChanged | Vst::kLatencyChanged;
constexpr int32 kShowing = Vst::kParamValuesChanged | Vst::kParamTitlesChanged;

void logFailure(const VST3Failure &failure) { DebugLog(L"%ls: %ls", failure.step, failure.reason); }

} // namespace

QString VST3Plugin::identifierPrefix() const { return QString::fromLatin1(PluginPrefix::kVst3); }

VST3Plugin::~VST3Plugin() { unload(); }

bool VST3Plugin::openClass(const EffectRecord &record)
{
    auto dropHalfMade = qScopeGuard([this] { m_instance.close(); });
    try {
        unload();
        setTornDown(false);
        m_hostContext = VST3HostContext::createOwned(static_cast<IVST3EditOwner *>(this));
        if (const auto failure = m_module.open(record.path)) {
            logFailure(*failure);
            return false;
        }
        // Not around the loading as well: what passes the system's loader ends the process.
        const bool created = callTranslated([&] { return createInstance(record); });
        if (created)
            dropHalfMade.dismiss();
        return created;
    } catch (const std::runtime_error &error) {
        DebugLog(L"%s", error.what());
    }
    return false;
}

bool VST3Plugin::createInstance(const EffectRecord &record)
{
    const FUID classId = classIdOf(record.id);
    if (!classId.isValid()) {
        DebugLog(L"'%ls' is not a class identifier", record.id);
        return false;
    }
    IPluginFactory *factory = nullptr;
    if (const auto failure = m_module.queryFactory(factory)) {
        logFailure(*failure);
        return false;
    }
    const bool created = m_instance.create(factory, classId, *m_hostContext);
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
    callPlugin("when it was closed", [this] { m_processor.detach(); });
    m_instance.close();
    m_module.close();
}

/// Makes a call into the plug-in; what it throws is logged and counts as a refusal.
template <typename Call>
bool VST3Plugin::callPlugin(const char *when, Call &&call)
{
    bool accepted = false;
    const QString thrown = thrownBy([&] {
        if constexpr (std::is_void_v<std::invoke_result_t<Call>>) {
            call();
            accepted = true;
        } else {
            accepted = call();
        }
    });
    if (!thrown.isEmpty())
        DebugLog(L"%ls: %s, %ls", m_record.name, when, thrown);
    return accepted;
}

bool VST3Plugin::openPlugin(const AudioSettings &settings)
{
    const bool hasAudio = isInstantiated() && callPlugin("when it was opened", [this] {
                              return m_processor.attach(m_instance.component());
                          });
    if (!hasAudio)
        DebugLog(L"%ls has no audio side that can be used", m_record.name);
    return hasAudio && applySettings(settings);
}

bool VST3Plugin::applySettings(const AudioSettings &settings)
{
    return callPlugin("when it was set up",
                      [&] { return m_processor.setUp(settings.sampleRate, settings.blockSize); });
}

bool VST3Plugin::setBusFormats(int inputFormat, int outputFormat)
{
    const TAutoLockCS lock(&processingLock());
    if (!isOpen())
        return false;
    const bool wasRunning = isRunning();
    stop();
    const bool accepted = callPlugin("when its buses were set", [&] {
        return m_processor.setFormats({inputFormat, outputFormat}, m_settings);
    });
    rebuildChannels();
    return (!wasRunning || start()) && accepted;
}

bool VST3Plugin::startProcessing()
{
    const bool started = callPlugin("when it was started", [this] { return m_processor.start(); });
    if (!started)
        deactivate();
    return started;
}

void VST3Plugin::stopProcessing()
{
    callPlugin("when it was stopped", [this] { m_processor.stop(); });
    deactivate();
}

void VST3Plugin::deactivate()
{
    callPlugin("when it was deactivated", [this] { m_processor.deactivate(); });
}

ChannelSetup VST3Plugin::readChannels()
{
    ChannelSetup channels;
    callPlugin("when its channels were counted", [&] { channels = m_processor.readChannels(); });
    return channels;
}

bool VST3Plugin::processBlock(ChannelBuffers &buffers, int frames)
{
    return callPlugin("when it processed a block", [&] { return m_processor.process(buffers, frames); });
}

bool VST3Plugin::StorePreset(PluginPreset &preset)
{
    showStatusWithLevel(MessageCode::kScanning, L"Storing %s Preset", m_record.name);
    const auto done = qScopeGuard([] { showStatusWithLevel(MessageCode::kCompleted, L""); });
    PluginPreset captured;
    callPlugin("when its state was stored", [&] { captured.data = m_instance.state(); });
    if (captured.data.isEmpty())
        return false;
    captured.isChunk = 1;
    captured.identifier = identifier();
    captured.name = m_record.name.toLatin1();
    storeSettings(captured);
    preset = captured;
    return true;
}

bool VST3Plugin::LoadPreset(const PluginPreset &preset)
{
    showStatusWithLevel(MessageCode::kScanning, L"Loading %s Preset", m_record.name);
    const auto done = qScopeGuard([] { showStatusWithLevel(MessageCode::kCompleted, L""); });
    if (preset.identifier != identifier() || preset.isChunk != 1) {
        DebugLog(L"The preset cannot be loaded into %ls: it is of %ls", m_record.name, preset.identifier);
        return false;
    }
    if (!callPlugin("when its state was loaded", [&] { return m_instance.setState(preset.data); }))
        return false;
    loadSettings(preset);
    tellListeners([this](IAudioPluginListener &listener) { listener.pluginChanged(*this); });
    return true;
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
