#pragma once

#include <QString>

class TestFolder;

/// A folder that holds Debian's zam-plugins and dpf-plugins-vst in "vst" and "vst3" and nothing else,
/// whatever other plug-ins the machine has: links to the packages' own files, or what scripts/windows-plugins
/// has built. Empty where they are missing.
QString realPlugins(const TestFolder &folder);
