#pragma once

#include "Tests/Fixtures/VST2/VST2Script.h"

/// Makes an effect and hands it out; "main" of a module that has both entry points gives its effects other
/// names and identifiers.
AEffect *makeEffect(const FixtureSubject &subject, audioMasterCallback host, bool isOfSecondMain);
/// Takes an effect back that the host is not to get.
void takeBack(AEffect *effect);
/// How many effects were handed out and never closed.
std::size_t openEffects();
