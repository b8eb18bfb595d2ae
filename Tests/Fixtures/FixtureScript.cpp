#include "Tests/Fixtures/FixtureScript.h"

#include "Tests/Fixtures/FixturePlatform.h"

#include <cerrno>
#include <cstdlib>
#include <limits>
#include <sstream>

namespace {

/// Reads the words of one line.
class LineReader {
public:
    explicit LineReader(const std::string &line)
        : m_line(line)
    {}

    /// Puts the next word into `word`; false at the end of the line.
    bool next(std::string &word)
    {
        while (m_position < m_line.size() && isBlank(m_line[m_position]))
            ++m_position;
        if (m_position == m_line.size() || m_line[m_position] == '#')
            return false;
        word.clear();
        bool quoted = false;
        for (; m_position < m_line.size() && (quoted || !isBlank(m_line[m_position])); ++m_position) {
            if (m_line[m_position] == '"')
                quoted = !quoted;
            else
                word += m_line[m_position] == '\\' ? escaped() : m_line[m_position];
        }
        if (quoted)
            throw ScriptError("a quotation mark is missing");
        return true;
    }

private:
    static bool isBlank(char character) { return character == ' ' || character == '\t'; }

    /// The byte that an escape stands for; leaves the position on the escape's last character.
    char escaped()
    {
        const char kind = ++m_position < m_line.size() ? m_line[m_position] : '\0';
        switch (kind) {
        case 'n':
            return '\n';
        case 't':
            return '\t';
        case '\\':
        case '"':
            return kind;
        case 'x':
            return hexadecimal();
        default:
            throw ScriptError("unknown escape");
        }
    }

    char hexadecimal()
    {
        const std::string digits = m_line.substr(m_position + 1, 2);
        if (digits.size() != 2 || digits.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos)
            throw ScriptError("\\x needs two hexadecimal digits");
        m_position += 2;
        return static_cast<char>(std::strtoul(digits.c_str(), nullptr, 16));
    }

    const std::string &m_line;
    std::size_t m_position = 0;
};

ScriptStatement parseLine(const std::string &text, int number)
{
    ScriptStatement statement;
    statement.line = number;
    try {
        LineReader reader(text);
        std::string word;
        if (reader.next(word))
            statement.key = word;
        while (reader.next(word))
            statement.words.push_back(word);
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
