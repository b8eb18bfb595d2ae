#include "Main/AudioEngineController/Effects/CLAP/CLAPPorts.h"

#include "Main/AudioEngineController/Effects/CLAP/CLAPInterface.h"

#include <algorithm>
#include <limits>

namespace {

/// More ports than any plug-in has; what a plug-in states beyond is not believed.
constexpr uint32_t kMaxPorts = 1024;

qint32 channels(const clap_plugin &plugin, const clap_plugin_audio_ports &ports, bool isInput)
{
    bool hasMain = false;
    quint64 sum = 0;
    const uint32_t count = std::min(ports.count(&plugin, isInput), kMaxPorts);
    for (uint32_t index = 0; index < count; ++index) {
        clap_audio_port_info info = {};
        if (!ports.get(&plugin, index, isInput, &info))
            continue;
        const bool isMain = (info.flags & CLAP_AUDIO_PORT_IS_MAIN) != 0;
        if (isMain && !hasMain)
            sum = 0;
        if (isMain || !hasMain)
            sum += info.channel_count;
        hasMain |= isMain;
    }
    return static_cast<qint32>(std::min<quint64>(sum, std::numeric_limits<qint32>::max()));
}

} // namespace

CLAPChannels channelsOf(const clap_plugin &plugin)
{
    const auto *const ports =
        static_cast<const clap_plugin_audio_ports *>(plugin.get_extension(&plugin, CLAP_EXT_AUDIO_PORTS));
    if (!ports || !ports->count || !ports->get)
        return {};
    return {channels(plugin, *ports, true), channels(plugin, *ports, false)};
}
