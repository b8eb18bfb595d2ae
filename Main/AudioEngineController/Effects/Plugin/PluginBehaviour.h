#pragma once

#include <QString>

/// What is known of single plug-ins and makers that no interface tells.
namespace PluginBehaviour {

/// The handle of the entry for a class of plug-ins ("vst") and a plug-in's key; 0 when nothing is known of
/// it.
int lookUp(const QString &pluginClass, const QString &key);
/// Whether a handle's entry marks an instrument, whatever category the plug-in states.
bool isInstrument(int handle);

} // namespace PluginBehaviour
