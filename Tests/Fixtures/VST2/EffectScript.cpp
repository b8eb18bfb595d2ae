#include "Tests/Fixtures/VST2/EffectScript.h"

#include <charconv>
#include <cstring>

namespace {

// The sizes of the buffers that the host hands over.
const std::size_t kNameBuffer = 1024;
const std::size_t kVendorBuffer = 256;
const std::size_t kParameterBuffer = 128;

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
    if (statement.take<std::int32_t>({{"id", &effect.uniqueId},
                                      {"magic", &effect.magic},
                                      {"inputs", &effect.inputs},
                                      {"outputs", &effect.outputs}}) ||
        statement.take<std::optional<std::int32_t>>({{"category", &effect.category},
                                                     {"flags", &effect.flags},
                                                     {"stated-parameters", &effect.statedParameters}}) ||
        statement.take<std::optional<std::string>>({{"chunk", &effect.chunk}}))
        return true;
    if (statement.key == "name")
        effect.name = readText(statement, 0, kNameBuffer);
    else if (statement.key == "vendor")
        effect.vendor = readText(statement, 0, kVendorBuffer);
    else if (statement.key == "parameter")
        effect.parameters.push_back(readParameter(statement));
    else if (statement.key == "editor")
        effect.editor = {statement.number(0), statement.number(1)};
    else if (statement.key == "new-outputs")
        effect.newOutputs = {statement.word(0), statement.number(1)};
    else if (statement.key == "null-chunk")
        effect.nullChunk = true;
    else if (statement.key == "own-thread")
        effect.ownThread = true;
    else
        return false;
    const bool isFlag = statement.key == "null-chunk" || statement.key == "own-thread";
    statement.allowWords(isFlag ? 0 : statement.key == "parameter" ? 3 : 2);
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
