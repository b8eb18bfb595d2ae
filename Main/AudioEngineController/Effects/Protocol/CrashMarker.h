#pragma once

#include "Core/BaseLib/Files/TextFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"

#include <functional>

/// A crash marker: a small file that names the plug-in being probed. One that survives its process names the
/// culprit.

/// The marker file's full path in a catalogue folder. An absent (null) name is made from the plug-in's path.
/// What a file system does not take in a name is replaced, and a name that is too long is cut: a plug-in
/// without a marker is probed unprotected.
QString markerPath(const MarkerFormat &format, const QString &folder, const QString &path,
                   const QString &name);

/// Writes a marker, replacing any file of that name.
FileResult writeMarkerFile(const MarkerFormat &format, const QString &marker, const EffectRecord &record);

/// Reads a marker into a fresh record that is not enabled. One that is damaged gives empty fields.
/// The file stays: it is deleted once the catalogue holds what it said.
EffectRecord readMarkerFile(const MarkerFormat &format, const QString &marker);

/// Deletes a marker's file; one that stays would name a culprit to the next run, and is logged.
void removeMarkerFile(const QString &marker);

/// The markers of this process that are on disk now. Any thread.
namespace ActiveMarkers {
void add(const QString &marker);
/// True when a marker of that path is on disk; compared without case, as some file systems do.
bool contains(const QString &marker);
/// Deletes the marker's file and forgets it.
void remove(const QString &marker);
/// When a plug-in is being probed: deletes its markers, so that nobody is blamed, and calls `then` while no
/// new marker can appear.
void abandon(const std::function<void()> &then);
} // namespace ActiveMarkers
