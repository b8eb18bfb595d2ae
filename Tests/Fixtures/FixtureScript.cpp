#include "Tests/Fixtures/FixtureScript.h"

#include "Tests/Fixtures/FixturePlatform.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <limits>
#include <sstream>

namespace {

/// The byte of an escape that begins at `position`, which then is that of its last character.
char escaped(const std::string &line, std::size_t &position)
{
    const char kind = ++position < line.size() ? line[position] : '\0';
    if (kind == '\\' || kind == '"')
        return kind;
    if (kind == 'n' || kind == 't')
        return kind == 'n' ? '\n' : '\t';
    const std::string digits = line.substr(std::min(position + 1, line.size()), 2);
    if (kind != 'x' || digits.size() != 2 ||
        digits.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos)
        throw ScriptError("unknown escape");
    position += 2;
    return static_cast<char>(std::strtoul(digits.c_str(), nullptr, 16));
}

std::vector<std::string> wordsOf(const std::string &line)
{
    std::vector<std::string> words;
    bool quoted = false;
    bool inWord = false;
    for (std::size_t position = 0; position < line.size(); ++position) {
        const char character = line[position];
        const bool isBlank = !quoted && (character == ' ' || character == '\t');
        if (!inWord && character == '#')
            break;
        if (!inWord && !isBlank)
            words.emplace_back();
        inWord = !isBlank;
        if (character == '"')
            quoted = !quoted;
        else if (inWord)
            words.back() += character == '\\' ? escaped(line, position) : character;
    }
    if (quoted)
        throw ScriptError("a quotation mark is missing");
    return words;
}

ScriptStatement parseLine(const std::string &text, int number)
{
    ScriptStatement statement;
    statement.line = number;
    try {
        statement.words = wordsOf(text);
        if (!statement.words.empty()) {
            statement.key = statement.words.front();
            statement.words.erase(statement.words.begin());
        }
    } catch (const ScriptError &error) {
        statement.fail(error.what());
    }
    return statement;
}

} // namespace

const std::string &ScriptStatement::word(std::size_t index) const
{
    if (index >= words.size())
        fail("word " + std::to_string(index + 1) + " is missing");
    return words[index];
}

std::string ScriptStatement::optionalWord(std::size_t index) const
{
    return index < words.size() ? words[index] : std::string();
}

std::int32_t ScriptStatement::number(std::size_t index) const
{
    try {
        return parseNumber(word(index));
    } catch (const ScriptError &error) {
        fail(error.what());
    }
}

void ScriptStatement::allowWords(std::size_t most) const
{
    if (words.size() > most)
        fail("word " + std::to_string(most + 1) + " is one too many");
}

void ScriptStatement::fail(const std::string &reason) const
{
    throw ScriptError("line " + std::to_string(line) + ", '" + key + "': " + reason);
}

std::vector<ScriptStatement> parseScript(const std::string &script)
{
    std::vector<ScriptStatement> statements;
    std::istringstream lines(script);
    std::string text;
    for (int number = 1; std::getline(lines, text); ++number) {
        if (!text.empty() && text.back() == '\r')
            text.pop_back();
        ScriptStatement statement = parseLine(text, number);
        if (!statement.key.empty())
            statements.push_back(std::move(statement));
    }
    return statements;
}

std::optional<std::vector<ScriptStatement>> moduleStatements()
{
    std::string script;
    return readFile(modulePath() + ".script", script) ? std::make_optional(parseScript(script))
                                                      : std::nullopt;
}

std::int32_t parseNumber(const std::string &text)
{
    const bool hexadecimal = text.rfind("0x", 0) == 0;
    char *end = nullptr;
    errno = 0;
    const long long value = std::strtoll(text.c_str(), &end, hexadecimal ? 16 : 10);
    const long long most =
        hexadecimal ? std::numeric_limits<std::uint32_t>::max() : std::numeric_limits<std::int32_t>::max();
    if (text.empty() || *end != '\0' || errno != 0 || value > most ||
        value < std::numeric_limits<std::int32_t>::min())
        throw ScriptError("'" + text + "' is no 32-bit number");
    return static_cast<std::int32_t>(static_cast<std::uint32_t>(value));
}

std::int32_t numberOfAnswer(const std::string &answer)
{
    try {
        return parseNumber(answer);
    } catch (const ScriptError &error) {
        reportMisuse(error.what());
    }
}

std::string baseName(const std::string &path)
{
    const std::string name = path.substr(path.find_last_of("/\\") + 1);
    return name.substr(0, name.rfind('.'));
}
