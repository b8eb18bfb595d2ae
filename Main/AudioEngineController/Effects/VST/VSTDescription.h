#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTEffect.h"

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
/// Names an effect. `shellId` is the sub-plug-in that it was made for; 0: none.
VSTNaming nameEffect(VSTEffect &effect, const QString &path, VstInt32 shellId);
/// Names the effect that was made for a record's path and sub-plug-in, and reads into the record what the
/// catalogue holds of it: name, identifier, category, vendor, width and latency; and its channels as stated.
/// Each is read when its turn comes, since plug-ins change their fields in a call.
void describeEffect(VSTEffect &effect, EffectRecord &record);

/// More sub-plug-ins than any shell has: an enumeration that goes on beyond, or repeats itself as often, is
/// cut.
inline constexpr std::size_t kMaxSubPlugins = 4096;

/// A sub-plug-in that a shell names.
struct VSTSubPlugin {
    quint32 id;
    QString name;
};

/// Asks a shell of that name for its sub-plug-ins, each identifier once.
std::vector<VSTSubPlugin> subPluginsOf(VSTEffect &shell, const QString &name);
