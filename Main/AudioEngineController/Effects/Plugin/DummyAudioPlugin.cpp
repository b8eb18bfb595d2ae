#include "Main/AudioEngineController/Effects/Plugin/DummyAudioPlugin.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <algorithm>

namespace {

/// The channels of a stored span; a preset may hold any numbers.
ChannelRange rangeOf(int first, int span)
{
    const int start = std::clamp(first, 0, AudioPlugin::kMaxChannels);
    return {start, start + std::clamp(span, 0, AudioPlugin::kMaxChannels) - 1};
}

} // namespace

DummyAudioPlugin::DummyAudioPlugin(const QString &identifier, const QString &name)
    : m_missing(identifier)
    , m_name(name.isEmpty() ? identifier : name)
{}

QString DummyAudioPlugin::identifierPrefix() const { return QString::fromLatin1(PluginPrefix::kPlaceholder); }

bool DummyAudioPlugin::StorePreset(PluginPreset &preset)
{
    if (!m_preset)
        return false;
    preset = *m_preset;
    return true;
}

bool DummyAudioPlugin::LoadPreset(const PluginPreset &preset)
{
    if (preset.identifier != m_missing) {
        DebugLog(L"The preset is of %ls, not of %ls", preset.identifier, m_missing);
        return false;
    }
    m_preset = preset;
    if (!preset.name.isEmpty())
        m_name = QString::fromLatin1(preset.name);
    rebuildChannels();
    return true;
}

ChannelSetup DummyAudioPlugin::readChannels()
{
    if (!m_preset)
        return {};
    return {rangeOf(m_preset->firstChannels[0], m_preset->channelSpans[0]),
            rangeOf(m_preset->firstChannels[1], m_preset->channelSpans[1])};
}
