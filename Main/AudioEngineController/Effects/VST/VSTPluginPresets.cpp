#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTParameterList.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"
#include "Main/VLib/SimpleGUI.h"

#include <cmath>

namespace {

namespace vst = VstPublished;

/// More parameters than any plug-in has. One that states more is not believed, and not stored in part either.
constexpr VstInt32 kMaxParameters = 0x10000;
constexpr int kParameterNameSize = 128;
/// The index that gives or sets the state of the current program, not of the whole bank.
constexpr VstInt32 kOfProgram = 1;

/// What a plug-in tells about itself while its state is being set is no news to anybody.
class Ignoring {
public:
    Ignoring(VSTHost &host, VSTPlugin *plugin)
        : m_host(host)
        , m_plugin(plugin)
    {
        m_host.setIgnoredPlugin(plugin);
    }
    ~Ignoring() { m_host.stopIgnoring(m_plugin); }
    Ignoring(const Ignoring &) = delete;
    Ignoring &operator=(const Ignoring &) = delete;

private:
    VSTHost &m_host;
    VSTPlugin *m_plugin;
};

/// The reason why a preset cannot be loaded.
bool refuse(const QString &plugin, const QString &reason)
{
    DebugLog(L"The preset cannot be loaded into %ls: %ls", plugin, reason);
    return false;
}

/// The short label among a parameter's properties, read from a buffer that the plug-in filled.
QByteArray shortLabel(const QByteArray &properties)
{
    constexpr int kSize = sizeof(vst::VstParameterProperties::shortLabel);
    const char *label = properties.constData() + offsetof(vst::VstParameterProperties, shortLabel);
    return QByteArray(label, static_cast<int>(strnlen(label, kSize)));
}

} // namespace

VstInt32 VSTPlugin::statedParameterCount() const
{
    return m_effect.fields().value_or(VSTEffect::Fields{}).numParams;
}

std::optional<VstInt32> VSTPlugin::parameterCount() const
{
    const VstInt32 stated = statedParameterCount();
    if (stated >= 0 && stated <= kMaxParameters)
        return stated;
    DebugLog(L"%ls states %d parameters, which cannot be", m_name, stated);
    return std::nullopt;
}

QString VSTPlugin::parameterName(VstInt32 index)
{
    QByteArray text;
    if (isCallable())
        text = m_effect.textAt(effGetParamName, index, kParameterNameSize);
    if (text.isEmpty() || text == " ") {
        const QByteArray properties = isCallable() ? m_effect.parameterProperties(index) : QByteArray();
        text = properties.isNull() ? "Param" + QByteArray::number(qint64(index) + 1) : shortLabel(properties);
    }
    while (text.endsWith(' '))
        text.chop(1);
    return QString::fromLatin1(text);
}

bool VSTPlugin::StorePreset(PluginPreset &preset)
{
    showStatusWithLevel(MessageCode::kScanning, L"Storing %s Preset", m_name);
    PluginPreset captured;
    captured.identifier = identifier();
    captured.name = m_name.toLatin1();
    const VstInt32 flags = m_effect.fields().value_or(VSTEffect::Fields{}).flags;
    const bool keepsState = (flags & effFlagsProgramChunks) != 0;
    const bool goesOn = isCallable() && (keepsState ? storeState(captured) : storeParameters(captured));
    if (goesOn) {
        storeSettings(captured);
        preset = captured;
    }
    showStatusWithLevel(MessageCode::kCompleted, L"");
    return goesOn && !captured.data.isEmpty();
}

/// Takes the plug-in's own state; false when the preset is not to be made. A plug-in that answers 1 has none
/// to give, and the preset carries the settings only.
bool VSTPlugin::storeState(PluginPreset &preset)
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

bool VSTPlugin::storeParameters(PluginPreset &preset)
{
    DebugTrace(L"VSTPlugin::StorePreset - EFFECT DOES NOT SUPPORTS CHUNKS");
    const std::optional<VstInt32> count = parameterCount();
    if (!count)
        return false;
    DebugTrace(L"VSTPlugin::StorePreset - Storing %d Parameters", *count);
    std::vector<VSTStoredParameter> parameters;
    for (VstInt32 index = 0; index < *count && isCallable(); ++index) {
        const QByteArray name = storedName(parameterName(index));
        const std::optional<float> value = isCallable() ? m_effect.parameter(index) : std::nullopt;
        if (!value)
            return false; // half of a state is none
        parameters.push_back({name, *value});
    }
    preset.data = writeParameterList(parameters);
    return true;
}

bool VSTPlugin::LoadPreset(const PluginPreset &preset)
{
    showStatusWithLevel(MessageCode::kScanning, L"Loading %s Preset", m_name);
    const bool loaded = isLoadable(preset) && (preset.isChunk ? loadState(preset) : loadParameters(preset));
    if (loaded) {
        loadSettings(preset);
        tellListeners([this](IAudioPluginListener &listener) { listener.pluginChanged(*this); });
    }
    showStatusWithLevel(MessageCode::kCompleted, L"");
    return loaded;
}

bool VSTPlugin::isLoadable(const PluginPreset &preset) const
{
    if (!isCallable())
        return refuse(m_name, QStringLiteral("the plug-in cannot be called any more"));
    const QString requested = identifierPrefix() + m_requestedKey;
    if (preset.identifier != identifier() && (m_requestedKey.isEmpty() || preset.identifier != requested))
        return refuse(m_name, QStringLiteral("it is of ") + preset.identifier);
    if (preset.data.isEmpty())
        return refuse(m_name, QStringLiteral("it holds no data"));
    if (preset.isChunk != 0 && preset.isChunk != 1)
        return refuse(m_name, QStringLiteral("it is of a kind that nobody knows"));
    const VstInt32 flags = m_effect.fields().value_or(VSTEffect::Fields{}).flags;
    if (preset.isChunk && !(flags & effFlagsProgramChunks))
        return refuse(m_name, QStringLiteral("the plug-in keeps no state of its own any more"));
    return true;
}

bool VSTPlugin::loadState(const PluginPreset &preset)
{
    const Ignoring ignoring(m_host, this);
    QByteArray data(preset.data.constData(), preset.data.size()); // a copy: a plug-in may write to it
    if (m_effect.dispatchAt(effSetChunk, kOfProgram, data.size(), data.data()))
        return true;
    DebugLog(L"VST Plugin exception in %ls", m_name);
    return false;
}

bool VSTPlugin::loadParameters(const PluginPreset &preset)
{
    QString reason;
    const auto stored = readParameterList(preset.data, reason);
    if (!stored)
        return refuse(m_name, reason);
    const std::optional<VstInt32> count = parameterCount();
    if (!count)
        return false;
    const Ignoring ignoring(m_host, this);
    std::map<QByteArray, std::deque<VstInt32>> indexes;
    for (VstInt32 index = 0; index < *count; ++index)
        indexes[storedName(parameterName(index))].push_back(index);
    const bool set = setParameters(*stored, indexes);
    if (!set)
        DebugLog(L"VST Plugin exception in %ls", m_name);
    return set;
}

/// Sets parameters by name; of several with one name, the first stored goes to the plug-in's first, and so
/// on. What the plug-in does not have, or no plug-in can take, is left out. False when a call failed.
bool VSTPlugin::setParameters(const std::vector<VSTStoredParameter> &stored,
                              std::map<QByteArray, std::deque<VstInt32>> &indexes)
{
    bool set = true;
    send(vst::effBeginSetProgram);
    for (const VSTStoredParameter &parameter : stored) {
        std::deque<VstInt32> &named = indexes[parameter.name];
        if (named.empty() || !std::isfinite(parameter.value)) {
            DebugLog(L"%ls does not take the parameter %ls", m_name, QString::fromLatin1(parameter.name));
            continue;
        }
        set = set && isCallable() && m_effect.setParameter(named.front(), parameter.value);
        named.pop_front();
    }
    return send(vst::effEndSetProgram) && set;
}
