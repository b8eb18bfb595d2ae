#pragma once

#include <pluginterfaces/base/funknown.h>

#include <string>

/// The result code for a name such as "not-implemented" or for a number; "null" is kResultOk. Throws
/// ScriptError. Names, since the numbers differ between platforms.
Steinberg::tresult resultFromName(const std::string &name);
/// The name of a result code; a number with 0x where it has none.
std::string resultName(Steinberg::tresult result);
