#pragma once

#include "Tests/Fixtures/VST3/ScriptedModule.h"

/// A new instance of a class under an interface, with one reference; no object where the class lacks it.
Steinberg::tresult createComponent(const ScriptedClass &described, Steinberg::FIDString interfaceId,
                                   void **object);
