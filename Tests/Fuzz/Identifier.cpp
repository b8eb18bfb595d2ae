#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ClassId.h"
#include "Tests/Fuzz/FuzzTarget.h"

void fuzzIdentifier(const QByteArray &input)
{
    const QString identifier = QString::fromUtf8(input);
    const QString prefix = prefixOf(identifier);
    require(identifier.startsWith(prefix), "the prefix is the identifier's start");
    require(!formatName(prefix).isEmpty(), "each prefix has a name to show");
    require(formatOfPrefix(prefix) == PluginFormat::Unknown || prefix.endsWith(':'),
            "what names a format ends with a colon");

    const QString id = identifier.mid(prefix.size());
    const Steinberg::FUID classId = classIdOf(id);
    if (classId.isValid())
        require(classIdText(classId) == id.toUpper(), "a class id is spelt as it was read");

    VSTHost host;
    require(!host.loadPlugin(id).isKnown, "an empty host knows no plug-in");
    EffectRecord record;
    record.id = id;
    record.enabled = false; // so that nothing is loaded
    const bool isAdded = host.AddEffect(record);
    require(isAdded != id.isEmpty(), "every identifier but the empty one can be listed");
    for (const QString &key : {id, "Waves " + id})
        require(host.loadPlugin(key).isKnown == isAdded, "a plug-in is found by its key, and by its old one");
}
