#pragma once

#include <pluginterfaces/base/funknown.h>

#include <string>

/// Whether a question to the host is known.
bool isHostQuestion(const std::string &question);
/// Asks the host's context as a plug-in does while it is initialised; the answer as one line of text.
std::string askHost(const std::string &question, Steinberg::FUnknown *context);
