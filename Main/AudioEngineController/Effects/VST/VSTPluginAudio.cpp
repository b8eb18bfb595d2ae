#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"

#include <algorithm>

// What a plug-in is sent when it is used for audio. A probe does none of this.

namespace {

namespace vst = VstPublished;

/// Interfaces state 24 bytes for the name of a program; plug-ins write more.
constexpr int kProgramNameSize = 256;
/// How knobs follow the mouse: along a straight line.
constexpr VstIntPtr kLinearKnobs = 2;

/// The channels of a stated count. A negative one gives a negative span, and channels that are not usable.
ChannelRange rangeOf(VstInt32 count) { return {0, std::max(count, -1) - 1}; }

} // namespace

bool VSTPlugin::openPlugin(const AudioSettings &settings)
{
    if (!isCallable()) {
        DebugLog(L"%ls is not loaded and cannot be opened", m_name);
        return false;
    }
    if (!m_effectOpened && !m_effect.dispatchAt(effOpen, 0, 0, nullptr))
        return false;
    m_effectOpened = true;
    if (!applySettings(settings) || !sendValue(vst::effSetEditKnobMode, kLinearKnobs))
        return false;
    m_takesMidi = canDo("receiveVstMidiEvent");
    m_canBypass = canDo("bypass");
    return isCallable();
}

bool VSTPlugin::applySettings(const AudioSettings &settings)
{
    if (isCallable())
        m_effect.dispatchFloat(effSetSampleRate, static_cast<float>(settings.sampleRate));
    return sendValue(effSetBlockSize, settings.blockSize);
}

bool VSTPlugin::send(VstInt32 opcode)
{
    if (isCallable())
        m_effect.dispatch(opcode);
    return isCallable();
}

bool VSTPlugin::sendValue(VstInt32 opcode, VstIntPtr value)
{
    if (isCallable())
        m_effect.dispatchValue(opcode, value);
    return isCallable();
}

bool VSTPlugin::canDo(const char *capability)
{
    QByteArray text(capability); // a copy: a plug-in may write to it
    return isCallable() && static_cast<VstInt32>(m_effect.dispatch(effCanDo, text.data())) > 0;
}

bool VSTPlugin::startProcessing() { return sendValue(effMainsChanged, 1) && send(effStartProcess); }

void VSTPlugin::stopProcessing()
{
    send(effStopProcess);
    sendValue(effMainsChanged, 0);
}

ChannelSetup VSTPlugin::readChannels()
{
    if (!isOpen())
        return {}; // a plug-in may report changes while it is only probed
    const VSTEffect::Fields fields = m_effect.fields().value_or(VSTEffect::Fields{});
    return {rangeOf(fields.numInputs), rangeOf(fields.numOutputs)};
}

bool VSTPlugin::bypassPlugin(bool bypassed)
{
    return m_canBypass && sendValue(vst::effSetBypass, bypassed ? 1 : 0);
}

void VSTPlugin::close()
{
    closeEditor();
    AudioPlugin::close();
}

bool VSTPlugin::processEvents(VstEvents &events)
{
    if (!isOpen() || !isCallable() || !(m_takesMidi || m_wantsMidi))
        return false;
    m_effect.dispatch(effProcessEvents, &events);
    return true;
}

void VSTPlugin::setTotalSamples(qint64 samples)
{
    if (isOpen())
        sendValue(effSetTotalSampleToProcess, static_cast<VstIntPtr>(samples));
}

VstInt32 VSTPlugin::programCount() const
{
    return std::max(m_effect.fields().value_or(VSTEffect::Fields{}).numPrograms, 0);
}

bool VSTPlugin::setProgram(VstInt32 index)
{
    return index >= 0 && index < programCount() && send(vst::effBeginSetProgram) &&
           sendValue(effSetProgram, index) && send(vst::effEndSetProgram);
}

QString VSTPlugin::programName()
{
    if (!isCallable())
        return QString();
    return QString::fromLatin1(m_effect.dispatchText(effGetProgramName, kProgramNameSize).bytes);
}

std::optional<QRect> VSTPlugin::editorRect()
{
    const bool hasEditor = (m_effect.fields().value_or(VSTEffect::Fields{}).flags & effFlagsHasEditor) != 0;
    return hasEditor && isCallable() ? m_effect.editorRect() : std::nullopt;
}

bool VSTPlugin::openEditor(void *window)
{
    if (!isOpen() || m_editorOpen || !editorRect())
        return false;
    m_effect.dispatch(effEditOpen, window);
    m_editorOpen = isCallable();
    return m_editorOpen;
}

void VSTPlugin::closeEditor()
{
    if (m_editorOpen.exchange(false))
        send(effEditClose);
}

void VSTPlugin::idle()
{
    if (!isOpen() || !isCallable())
        return;
    // A plug-in that asked once is called until it answers that it needs no more.
    if (m_needsIdle.exchange(false) && m_effect.dispatch(vst::effIdle) != 0)
        m_needsIdle = true;
    if (m_editorOpen)
        send(vst::effEditIdle);
}

void VSTPlugin::ioChanged()
{
    m_ioChanged = true;
    m_speakersPending = true;
    rebuildChannels();
}

bool VSTPlugin::resizeEditor(VstInt32 width, VstInt32 height)
{
    bool resized = false;
    if (m_editorOpen)
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
