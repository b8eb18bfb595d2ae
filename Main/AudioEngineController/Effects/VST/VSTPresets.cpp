#include "Main/AudioEngineController/Effects/VST/VSTPresets.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/VSTParameterList.h"

#include <cmath>

namespace {

namespace vst = VstPublished;

/// The index that sets the state of the current program, not of the whole bank.
constexpr VstInt32 kOfProgram = 1;

} // namespace

bool VSTPresets::keepsState() const
{
    return (m_effect.fields().value_or(VSTEffect::Fields{}).flags & effFlagsProgramChunks) != 0;
}

bool VSTPresets::capture(PluginPreset &preset)
{
    const bool isState = keepsState();
    return m_effect.isCallable() && (isState ? captureState(preset) : captureParameters(preset));
}

/// Takes the plug-in's own state. A plug-in that answers 1 has none to give, and the preset carries the
/// settings only.
bool VSTPresets::captureState(PluginPreset &preset)
{
    DebugTrace(L"VSTPlugin::StorePreset - EFFECT SUPPORTS CHUNKS");
    const VSTEffect::Chunk chunk = m_effect.programChunk();
    if (chunk.data.isEmpty())
        DebugTrace(L"VSTPlugin::StorePreset - FAILED");
    else
        preset.isChunk = 1;
    preset.data = chunk.data;
    return preset.isChunk || chunk.answer == 1;
}

bool VSTPresets::captureParameters(PluginPreset &preset)
{
    DebugTrace(L"VSTPlugin::StorePreset - EFFECT DOES NOT SUPPORTS CHUNKS");
    const std::optional<VstInt32> count = m_parameters.count();
    if (!count)
        return false;
    DebugTrace(L"VSTPlugin::StorePreset - Storing %d Parameters", *count);
    std::vector<VSTStoredParameter> parameters;
    for (VstInt32 index = 0; index < *count && m_effect.isCallable(); ++index) {
        const QByteArray name = storedName(m_parameters.name(index));
        const std::optional<float> value = m_effect.isCallable() ? m_effect.parameter(index) : std::nullopt;
        if (!value)
            return false; // half of a state is not a state
        parameters.push_back({name, *value});
    }
    preset.data = writeParameterList(parameters);
    return true;
}

bool VSTPresets::restore(const PluginPreset &preset, const QStringList &identifiers)
{
    QString reason = reasonAgainst(preset, identifiers);
    if (reason.isEmpty() && preset.isChunk)
        return restoreState(preset.data);
    if (reason.isEmpty())
        if (const auto stored = readParameterList(preset.data, reason))
            return restoreParameters(*stored);
    DebugLog(L"The preset cannot be loaded into %ls: %ls", m_naming.name, reason);
    return false;
}

/// Why a preset cannot be loaded; empty when nothing seems to be against it.
QString VSTPresets::reasonAgainst(const PluginPreset &preset, const QStringList &identifiers) const
{
    if (!m_effect.isCallable())
        return QStringLiteral("the plug-in cannot be called any more");
    if (!identifiers.contains(preset.identifier))
        return QStringLiteral("it is of ") + preset.identifier;
    if (preset.data.isEmpty())
        return QStringLiteral("it holds no data");
    if (preset.isChunk != 0 && preset.isChunk != 1)
        return QStringLiteral("it is of an unknown kind");
    if (preset.isChunk && !keepsState())
        return QStringLiteral("the plug-in keeps no state of its own any more");
    return QString();
}

bool VSTPresets::restoreState(const QByteArray &data)
{
    QByteArray copy(data.constData(), data.size()); // a plug-in may write to it
    if (m_effect.dispatchAt(effSetChunk, kOfProgram, copy.size(), copy.data()))
        return true;
    DebugLog(L"VST Plugin exception in %ls", m_naming.name);
    return false;
}

bool VSTPresets::restoreParameters(const std::vector<VSTStoredParameter> &stored)
{
    const std::optional<VstInt32> count = m_parameters.count();
    if (!count)
        return false;
    std::map<QByteArray, std::deque<VstInt32>> indexes;
    for (VstInt32 index = 0; index < *count; ++index)
        indexes[storedName(m_parameters.name(index))].push_back(index);
    const bool set = setParameters(stored, indexes);
    if (!set)
        DebugLog(L"VST Plugin exception in %ls", m_naming.name);
    return set;
}

/// Sets parameters by name; of several with one name, the first stored goes to the plug-in's first, and so
/// on. What the plug-in does not have, or no plug-in can take, is left out. False when a call failed.
bool VSTPresets::setParameters(const std::vector<VSTStoredParameter> &stored,
                               std::map<QByteArray, std::deque<VstInt32>> &indexes)
{
    bool set = true;
    m_effect.send(vst::effBeginSetProgram);
    for (const VSTStoredParameter &parameter : stored) {
        std::deque<VstInt32> &named = indexes[parameter.name];
        if (named.empty() || !std::isfinite(parameter.value)) {
            DebugLog(L"%ls does not take the parameter %ls", m_naming.name,
                     QString::fromLatin1(parameter.name));
            continue;
        }
        set = set && m_effect.isCallable() && m_effect.setParameter(named.front(), parameter.value);
        named.pop_front();
    }
    return m_effect.send(vst::effEndSetProgram) && set;
}
