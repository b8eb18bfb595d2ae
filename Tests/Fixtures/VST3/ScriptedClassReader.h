#pragma once

#include "Tests/Fixtures/VST3/ScriptedModule.h"

/// A healthy class of this name: a stereo effect with an identifier made from the name.
ScriptedClass scriptedClass(const std::string &name);

/// Takes a statement that describes a class; false when the key is none of a class. Throws ScriptError.
bool takeClassStatement(ScriptedClass &described, const ScriptStatement &statement);
