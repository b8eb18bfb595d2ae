#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostContext.h"
#include "Main/VLib/SimpleGUI.h"

#include <algorithm>

namespace {

namespace vst = VstPublished;

/// How knobs follow the mouse: along a straight line.
constexpr VstIntPtr kLinearKnobs = 2;

/// The channels of a stated count. A negative one gives a negative span, and channels that are not usable.
ChannelRange rangeOf(VstInt32 count) { return {0, std::max(count, -1) - 1}; }

} // namespace

VSTPlugin::VSTPlugin() { VSTHostContext::instance().registerOwner(this); }

VSTPlugin::~VSTPlugin()
{
    setTornDown(true);
    unload();
    VSTHostContext::instance().unregisterOwner(this);
}

QString VSTPlugin::identifierPrefix() const { return QString::fromLatin1(PluginPrefix::kVst2); }

bool VSTPlugin::load(const EffectRecord &record, VSTHostCallbackFunction callback, int reloadMode)
{
    if (reloadMode == 0) {
        setTornDown(true);
        unload();
        setTornDown(false);
    }
    m_shellId = static_cast<VstInt32>(record.subId);
    const VSTLoadResult result = enter(record.path, callback);
    if (!result.isDone()) {
        if (result.status == VSTLoadResult::Status::EntryFailed)
            unload();
        DebugLog(L"%ls: %ls", record.path, result.reason);
        logFailedLoad(record.path, result);
        return false;
    }
    adopt(result.effect);
    m_naming = nameEffect(m_effect, record.path, m_shellId);
    return true;
}

VSTLoadResult VSTPlugin::enter(const QString &path, VSTHostCallbackFunction callback)
{
    VSTLoadResult result = m_module.load(path);
    return result.isDone() ? m_module.enter(callback, *this) : result;
}

void VSTPlugin::adopt(const VSTEffect &effect)
{
    const TAutoLockCS lock(&processingLock()); // a thread of the plug-in may have its channels rebuilt
    m_effect = effect;
    m_effectOpened = m_canBypass = m_takesMidi = false;
    m_needsIdle = m_wantsMidi = false; // of the effect before
    m_speakers.setPending();
}

void VSTPlugin::unload()
{
    if (!m_module.isLoaded())
        return;
    VSTPlugin::close();
    adopt(VSTEffect());
    m_module.unload();
}

bool VSTPlugin::openPlugin(const AudioSettings &settings)
{
    if (!m_effect.isCallable()) {
        DebugLog(L"%ls is not loaded and cannot be opened", name());
        return false;
    }
    if (!m_effectOpened && !m_effect.dispatchAt(effOpen, 0, 0, nullptr))
        return false;
    m_effectOpened = true;
    m_toldSampleRate = 0;
    if (!applySettings(settings) || !m_effect.sendValue(vst::effSetEditKnobMode, kLinearKnobs))
        return false;
    m_takesMidi = canDo("receiveVstMidiEvent");
    m_canBypass = canDo("bypass");
    return m_effect.isCallable();
}

bool VSTPlugin::applySettings(const AudioSettings &settings)
{
    if (m_effect.isCallable() && settings.sampleRate != m_toldSampleRate) {
        m_toldSampleRate = settings.sampleRate;
        m_effect.dispatchFloat(effSetSampleRate, static_cast<float>(settings.sampleRate));
    }
    return m_effect.sendValue(effSetBlockSize, settings.blockSize);
}

bool VSTPlugin::canDo(const char *capability)
{
    QByteArray text(capability); // a copy: a plug-in may write to it
    return m_effect.isCallable() && static_cast<VstInt32>(m_effect.dispatch(effCanDo, text.data())) > 0;
}

bool VSTPlugin::startProcessing()
{
    return m_effect.sendValue(effMainsChanged, 1) && m_effect.send(effStartProcess);
}

void VSTPlugin::stopProcessing()
{
    m_effect.send(effStopProcess);
    m_effect.sendValue(effMainsChanged, 0);
}

ChannelSetup VSTPlugin::readChannels()
{
    if (!isOpen())
        return {}; // a plug-in may report changes before it is opened
    const VSTEffect::Fields fields = m_effect.fields().value_or(VSTEffect::Fields{});
    return {rangeOf(fields.numInputs), rangeOf(fields.numOutputs)};
}

bool VSTPlugin::bypassPlugin(bool bypassed)
{
    return m_canBypass && m_effect.sendValue(vst::effSetBypass, bypassed ? 1 : 0);
}

void VSTPlugin::close()
{
    m_editor.close();
    AudioPlugin::close();
}

bool VSTPlugin::processEvents(VstEvents &events)
{
    if (!isOpen() || !m_effect.isCallable() || !(m_takesMidi || m_wantsMidi))
        return false;
    m_effect.dispatch(effProcessEvents, &events);
    return true;
}

void VSTPlugin::setTotalSamples(qint64 samples)
{
    if (isOpen())
        m_effect.sendValue(effSetTotalSampleToProcess, static_cast<VstIntPtr>(samples));
}

void VSTPlugin::idle()
{
    if (!isOpen() || !m_effect.isCallable())
        return;
    // A plug-in that asked once is called until it answers that it needs no more.
    if (m_needsIdle.exchange(false) && m_effect.dispatch(vst::effIdle) != 0)
        m_needsIdle = true;
    m_editor.idle();
}

bool VSTPlugin::UpdateSpeakerArrangement(int inputs, int outputs, bool force)
{
    if (!isOpen() || !m_effect.isCallable())
        return false;
    if (!m_speakers.isDue() && !force)
        return m_speakers.wasAccepted();
    const bool accepted = m_speakers.tell({inputs, outputs}, processingLock());
    const ChannelSetup known = channels();
    const ChannelSetup now = readChannels();
    if (now.inputs.span() != known.inputs.span() || now.outputs.span() != known.outputs.span())
        rebuildChannels(); // it adapted to the speakers, and not every plug-in says so
    return accepted;
}

bool VSTPlugin::StorePreset(PluginPreset &preset)
{
    showStatusWithLevel(MessageCode::kScanning, L"Storing %s Preset", name());
    PluginPreset captured;
    captured.identifier = identifier();
    captured.name = name().toLatin1();
    const bool goesOn = m_presets.capture(captured);
    if (goesOn) {
        storeSettings(captured);
        preset = captured;
    }
    showStatusWithLevel(MessageCode::kCompleted, L"");
    return goesOn && !captured.data.isEmpty();
}

bool VSTPlugin::LoadPreset(const PluginPreset &preset)
{
    showStatusWithLevel(MessageCode::kScanning, L"Loading %s Preset", name());
    QStringList identifiers(identifier());
    if (!m_requestedKey.isEmpty())
        identifiers.append(identifierPrefix() + m_requestedKey);
    const auto restore = [&] {
        VSTHostContext &context = VSTHostContext::instance();
        context.setIgnored(this); // nobody needs to hear what a plug-in reports about itself meanwhile
        const auto ignoring = qScopeGuard([&] { context.stopIgnoring(this); });
        return m_presets.restore(preset, identifiers);
    };
    const bool loaded = restore();
    if (loaded) {
        loadSettings(preset);
        tellListeners([this](IAudioPluginListener &listener) { listener.pluginChanged(*this); });
    }
    showStatusWithLevel(MessageCode::kCompleted, L"");
    return loaded;
}

void VSTPlugin::ioChanged()
{
    m_speakers.setPending();
    rebuildChannels();
}

bool VSTPlugin::resizeEditor(VstInt32 width, VstInt32 height)
{
    bool resized = false;
    if (m_editor.isOpen())
        tellListeners([&](IAudioPluginListener &listener) {
            resized = listener.resizeEditor(*this, width, height) || resized;
        });
    return resized;
}

void VSTPlugin::parameterChanged(VstInt32 index, float value)
{
    tellListeners([&](IAudioPluginListener &listener) {
        listener.parameterChanged(*this, static_cast<quint32>(index), static_cast<double>(value));
    });
}

void VSTPlugin::parameterEdit(VstInt32 index, bool begins)
{
    tellListeners([&](IAudioPluginListener &listener) {
        listener.parameterEdit(*this, static_cast<quint32>(index), begins);
    });
}

void VSTPlugin::refreshDisplay()
{
    tellListeners([this](IAudioPluginListener &listener) { listener.displayChanged(*this); });
}
