#pragma once

#include "Core/BaseLib/Binary/PluginLibrary.h"

#include <QString>

/// How a VST 3 module lies on disk and is started, which differs from platform to platform.
namespace VST3ModuleFile {

/// False for a path that a folder search finds although it is not a module: a part of a bundle.
bool isModule(const QString &path);
/// The file to load for a module's path; empty, with a reason, when the bundle holds none for this platform.
QString binary(const QString &path, QString &reason);
/// The folder of a bundle that holds the module for a machine ("x86_64-linux").
QString machineFolder(const QString &bundle, const char *machine);
/// Why a bundle holds no module for a machine: what it holds instead, or the system's words.
QString whyNoBinary(const QString &bundle, const char *machine);
/// The time stamp of the file that an update of the module replaces.
QString fileTime(const QString &path);
/// Calls the module's start function, if it exports one. False when the function reports failure.
bool start(PluginLibrary &library);
/// Calls the module's end function, if it exports one.
void end(PluginLibrary &library);

} // namespace VST3ModuleFile
