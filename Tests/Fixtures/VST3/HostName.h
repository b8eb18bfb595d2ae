#pragma once

#include <pluginterfaces/base/funknown.h>

#include <string>

/// Asks the host's context as a plug-in does while it is initialised.
std::string hostName(Steinberg::FUnknown *context);
