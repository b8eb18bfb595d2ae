#pragma once

#include "Tests/Fixtures/FixtureScript.h"

#include "Main/AudioEngineController/Effects/VST/VSTInterface.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

/// A text that the plug-in writes into a buffer of the host, as bytes.
struct ScriptedText {
    std::string bytes;
    bool terminated = true;

    /// Writes the text into `buffer`; what lies behind it is left as it was.
    void writeTo(void *buffer) const;
};

struct ScriptedParameter {
    ScriptedText name;
    float value = 0;
    std::optional<std::string> label; ///< without one there are no parameter properties
};

/// What a script says about one effect: the plug-in itself or a sub-plug-in.
struct EffectScript {
    ScriptedText name;
    ScriptedText vendor = {"Fixture Works"};
    std::int32_t uniqueId = 1000;
    std::int32_t magic = kEffectMagic;
    std::int32_t inputs = 2;
    std::int32_t outputs = 2;
    std::optional<std::int32_t> category;
    std::optional<std::int32_t> flags;
    std::optional<std::int32_t> statedParameters; ///< the count that is claimed, where it is not the true one
    std::vector<ScriptedParameter> parameters;
    std::optional<std::string> chunk;
    struct Editor {
        std::int32_t width;
        std::int32_t height;
    };
    std::optional<Editor> editor;
    struct ChangedCount {
        std::string stage;
        std::int32_t count;
    };
    std::optional<ChangedCount> newOutputs; ///< what `numOutputs` becomes at a stage
    bool nullChunk = false;                 ///< gives a null pointer in place of the chunk
    bool ownThread = false; ///< a thread that runs from the effect's making until it is closed
};

/// Takes a statement that describes an effect; false when its key is not one of those. Throws ScriptError.
bool takeEffectStatement(EffectScript &effect, const ScriptStatement &statement);

/// The text in a statement's word. One that fills a buffer of `size` bytes has no terminator; a longer one is
/// an error. Throws ScriptError.
ScriptedText readText(const ScriptStatement &statement, std::size_t index, std::size_t size);
/// A decimal number of any size, also "inf" and "nan". Throws ScriptError.
float readFloat(const ScriptStatement &statement, std::size_t index);
