#include "Tests/Fixtures/VST3/ScriptedClassReader.h"

using namespace Steinberg;

namespace {

/// The same for the same name everywhere; FNV-1a.
std::uint64_t hashOf(const std::string &text, std::uint64_t start)
{
    std::uint64_t hash = start;
    for (const char character : text)
        hash = (hash ^ static_cast<unsigned char>(character)) * 0x100000001B3u;
    return hash;
}

FUID idFromName(const std::string &name)
{
    const std::uint64_t first = hashOf(name, 0xCBF29CE484222325u);
    const std::uint64_t second = hashOf(name, first);
    return FUID(static_cast<uint32>(first >> 32), static_cast<uint32>(first),
                static_cast<uint32>(second >> 32), static_cast<uint32>(second));
}

/// Takes the digits as FUID prints them, so that a test finds them again in the catalogue on any platform.
FUID idFromDigits(const ScriptStatement &statement)
{
    const std::string &digits = statement.word(0);
    FUID id;
    if (digits.size() != 32 || digits.find_first_not_of("0123456789ABCDEFabcdef") != std::string::npos ||
        !id.fromString(digits.c_str()))
        statement.fail("an id has 32 hexadecimal digits");
    return id;
}

std::int32_t busType(const std::string &text)
{
    if (text == "main")
        return 0;
    return text == "aux" ? 1 : parseNumber(text);
}

/// Reads "channels" or "channels:type" for each bus.
std::vector<ScriptedBus> readBuses(const ScriptStatement &statement)
{
    std::vector<ScriptedBus> buses;
    for (const std::string &word : statement.words) {
        const std::size_t colon = word.find(':');
        ScriptedBus bus;
        bus.channels = parseNumber(word.substr(0, colon));
        bus.type = colon == std::string::npos ? 0 : busType(word.substr(colon + 1));
        buses.push_back(bus);
    }
    return buses;
}

/// The text that a key of a class describes, or null.
std::string *textOf(ScriptedClass &described, const std::string &key)
{
    if (key == "category")
        return &described.category;
    if (key == "subcategories")
        return &described.subCategories;
    if (key == "vendor")
        return &described.vendor;
    if (key == "controller")
        return &described.controller;
    return key == "version" ? &described.version : nullptr;
}

bool takeSingleWord(ScriptedClass &described, const ScriptStatement &statement)
{
    if (std::string *text = textOf(described, statement.key))
        *text = statement.word(0);
    else if (statement.key == "id")
        described.id = idFromDigits(statement);
    else if (statement.key == "state")
        described.state = statement.word(0);
    else if (statement.key == "stated-inputs")
        described.statedInputs = statement.number(0);
    else if (statement.key == "stated-outputs")
        described.statedOutputs = statement.number(0);
    else
        return false;
    statement.allowWords(1);
    return true;
}

} // namespace

ScriptedClass scriptedClass(const std::string &name)
{
    ScriptedClass described;
    described.name = name;
    described.id = idFromName(name);
    return described;
}

bool takeClassStatement(ScriptedClass &described, const ScriptStatement &statement)
{
    if (takeSingleWord(described, statement))
        return true;
    if (statement.key == "inputs")
        described.inputs = readBuses(statement);
    else if (statement.key == "outputs")
        described.outputs = readBuses(statement);
    else if (statement.key == "ask-host-name")
        described.asksHostName = true;
    else
        return false;
    return true;
}
