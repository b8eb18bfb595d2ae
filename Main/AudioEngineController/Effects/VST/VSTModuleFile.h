#pragma once

#include <QString>

/// How VST 2 modules lie on disk, which differs from platform to platform.
namespace VSTModuleFile {

/// The end of the files' names, with its dot.
QString ending();

} // namespace VSTModuleFile
