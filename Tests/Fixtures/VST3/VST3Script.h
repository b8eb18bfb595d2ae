#pragma once

#include "Tests/Fixtures/FixtureScript.h"

#include <pluginterfaces/base/funknown.h>

/// What the script beside the VST 3 module says; without one it has one class named after the file.
const FixtureScript &script();
/// What a statement says of a class.
std::string textOf(const FixtureSubject &described, const char *key, const char *usual = "");
/// The result that the script has for a stage, else kResultOk. Results have names, since the numbers differ
/// between platforms.
Steinberg::tresult resultAt(const std::string &stage, const FixtureSubject &subject = {});
/// The class id of the script, as FUID prints it; else made from the name, the same everywhere.
Steinberg::FUID idOf(const FixtureSubject &described);

/// A new instance of a class under an interface, with one reference; no object where the class lacks it.
Steinberg::tresult createInstanceOf(const FixtureSubject &described, Steinberg::FIDString interfaceId,
                                    void **object);
