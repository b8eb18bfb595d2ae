#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"

#include "Tests/Fuzz/FuzzTarget.h"

#include <QFile>

#include <tuple>

namespace {

bool isSamePlugin(const RememberedPlugin &left, const RememberedPlugin &right)
{
    const auto all = [](const RememberedPlugin &plugin) {
        return std::tie(plugin.id, plugin.subId, plugin.reason, plugin.inputs, plugin.outputs, plugin.heldBy);
    };
    return all(left) == all(right);
}

bool isSame(const RememberedProbe &left, const RememberedProbe &right)
{
    const auto all = [](const RememberedProbe &probe) {
        return std::tie(probe.path, probe.fileTime, probe.status, probe.stage, probe.reason,
                        probe.milliseconds);
    };
    return all(left) == all(right) && std::equal(left.plugins.begin(), left.plugins.end(),
                                                 right.plugins.begin(), right.plugins.end(), isSamePlugin);
}

} // namespace

void fuzzProbes(const QByteArray &input)
{
    const QString file = QLatin1String(kProbeMemoryFile);
    writeFuzzFile('.' + file, input);
    QFile::remove("here" + file);
    const ProbeMemory read(".");
    ProbeMemory written("here");
    for (const PluginFormatInfo &format : pluginFormats())
        read.forEach(format.format, [&](const RememberedProbe &probe) { written.set(probe); });
    require(bool(written.write()), "the file can be written");
    const ProbeMemory again("here");
    for (const PluginFormatInfo &format : pluginFormats())
        read.forEach(format.format, [&](const RememberedProbe &probe) {
            const RememberedProbe *const kept = again.find(format.format, probe.path);
            require(kept && isSame(*kept, probe), "what was read is written and read again the same");
        });
}
