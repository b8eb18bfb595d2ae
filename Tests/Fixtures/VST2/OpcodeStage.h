#pragma once

#include "Tests/Fixtures/FixtureStages.h"

/// The stages of a VST 2 plug-in's life.
std::vector<FixtureStage> stagesOfVST2();
/// The stage at which a dispatcher opcode is reached.
std::string stageOfOpcode(int opcode);
