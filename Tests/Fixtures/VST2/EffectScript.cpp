#include "Tests/Fixtures/VST2/EffectScript.h"

#include <charconv>
#include <cstring>

namespace {

// The sizes of the buffers that the host hands over.
const std::size_t kNameBuffer = 1024;
const std::size_t kVendorBuffer = 256;
const std::size_t kParameterBuffer = 128;

/// The number that a key describes, or null.
std::int32_t *numberOf(EffectScript &effect, const std::string &key)
{
    const struct {
        const char *key;
        std::int32_t *number;
    } numbers[] = {{"id", &effect.uniqueId},
                   {"magic", &effect.magic},
                   {"inputs", &effect.inputs},
                   {"outputs", &effect.outputs},
                   {"latency", &effect.latency}};
    for (const auto &entry : numbers) {
        if (key == entry.key)
            return entry.number;
    }
    return nullptr;
}

/// The number that a key describes and that has a computed default, or null.
std::optional<std::int32_t> *optionalNumberOf(EffectScript &effect, const std::string &key)
{
    if (key == "category")
        return &effect.category;
    if (key == "flags")
        return &effect.flags;
    return key == "stated-parameters" ? &effect.statedParameters : nullptr;
}

bool takeNumber(EffectScript &effect, const ScriptStatement &statement)
{
    if (std::int32_t *number = numberOf(effect, statement.key))
        *number = statement.number(0);
    else if (std::optional<std::int32_t> *optional = optionalNumberOf(effect, statement.key))
        *optional = statement.number(0);
    else
        return false;
    statement.allowWords(1);
    return true;
}

bool takeFlag(EffectScript &effect, const ScriptStatement &statement)
{
    if (statement.key == "null-chunk")
        effect.nullChunk = true;
    else if (statement.key == "own-thread")
        effect.ownThread = true;
    else
        return false;
    statement.allowWords(0);
    return true;
}

ScriptedParameter readParameter(const ScriptStatement &statement)
{
    ScriptedParameter parameter;
    parameter.name.bytes = statement.word(0);
    parameter.name.terminated = parameter.name.bytes.size() < kParameterBuffer;
    if (parameter.name.bytes.size() > kParameterBuffer)
        statement.fail("longer than the host's buffer");
    if (statement.words.size() > 1)
        parameter.value = readFloat(statement, 1);
    if (statement.words.size() > 2)
        parameter.label = statement.words[2];
    statement.allowWords(3);
    return parameter;
}

} // namespace

void ScriptedText::writeTo(void *buffer) const
{
    std::memcpy(buffer, bytes.data(), bytes.size());
    if (terminated)
        static_cast<char *>(buffer)[bytes.size()] = '\0';
}

bool takeEffectStatement(EffectScript &effect, const ScriptStatement &statement)
{
    if (takeNumber(effect, statement) || takeFlag(effect, statement))
        return true;
    if (statement.key == "name")
        effect.name = readText(statement, 0, kNameBuffer);
    else if (statement.key == "vendor")
        effect.vendor = readText(statement, 0, kVendorBuffer);
    else if (statement.key == "parameter")
        effect.parameters.push_back(readParameter(statement));
    else if (statement.key == "editor") {
        statement.allowWords(2);
        effect.editor = {statement.number(0), statement.number(1)};
    } else if (statement.key == "new-outputs") {
        statement.allowWords(2);
        effect.newOutputs = {statement.word(0), statement.number(1)};
    } else if (statement.key == "chunk") {
        statement.allowWords(1);
        effect.chunk = statement.word(0);
    } else
        return false;
    return true;
}

ScriptedText readText(const ScriptStatement &statement, std::size_t index, std::size_t size)
{
    ScriptedText text = {statement.word(index)};
    if (text.bytes.size() > size)
        statement.fail("longer than the host's buffer of " + std::to_string(size));
    text.terminated = text.bytes.size() < size;
    statement.allowWords(index + 1);
    return text;
}

float readFloat(const ScriptStatement &statement, std::size_t index)
{
    const std::string &text = statement.word(index);
    float value = 0;
    // Not of the C library: a script may set a locale with another decimal point.
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (error != std::errc() || end != text.data() + text.size())
        statement.fail("'" + text + "' is no number");
    return value;
}
