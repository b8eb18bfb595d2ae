#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/VST/VSTEffect.h"

#include <QString>

#include <vector>

// What a plug-in is asked about itself. The order of the calls is fixed: plug-ins are known to work with it.

/// What a plug-in is called.
struct VSTNaming {
    QString name;
    QString key;       ///< name, colon and unique id, at most 255 characters: the identifier in the catalogue
    int behaviour = 0; ///< handle of `PluginBehaviour`
};

/// The name that a path gives where the plug-in is not asked or tells none.
QString vstNameOfFile(const QString &path);
/// Names an effect. `fields` are those of the effect at hand, `shellId` the sub-plug-in that it was made for.
VSTNaming nameEffect(VSTEffect &effect, const VSTEffect::Fields &fields, const QString &path,
                     VstInt32 shellId);
/// Names the effect that was made for a record's path and sub-plug-in, and reads into the record what the
/// catalogue holds of it: name, identifier, category, vendor, width and latency.
void describeEffect(VSTEffect &effect, EffectRecord &record);

/// More sub-plug-ins than any shell has: an enumeration that goes on beyond is cut.
inline constexpr int kMaxSubPlugins = 4096;

/// A sub-plug-in that a shell names.
struct VSTSubPlugin {
    quint32 id;
    QString name;
};

/// Asks a shell of that name for its sub-plug-ins, each identifier once.
std::vector<VSTSubPlugin> subPluginsOf(VSTEffect &shell, const QString &name);
