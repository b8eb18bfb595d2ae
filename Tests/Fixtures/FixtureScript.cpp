#include "Tests/Fixtures/FixtureScript.h"

#include "Tests/Fixtures/FixturePlatform.h"

#include <algorithm>
#include <charconv>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iomanip>
#include <sstream>
#include <thread>

namespace {

/// Statements that name a stage, of every format.
const char kOrders[] = "effect delay fault answer ask-host";

bool holdsWord(const std::string &words, const std::string &word)
{
    return (' ' + words + ' ').find(' ' + word + ' ') != std::string::npos;
}

/// What stands for bytes that a script cannot hold otherwise.
std::string unescaped(const std::string &word)
{
    std::string text;
    for (std::size_t place = 0; place < word.size(); ++place) {
        const char kind = word[place] == '\\' && place + 1 < word.size() ? word[++place] : '\0';
        if (kind == 'x')
            text += static_cast<char>(std::strtoul(word.substr((place += 2) - 1, 2).c_str(), nullptr, 16));
        else
            text += kind == '\0' ? word[place] : kind;
    }
    return text;
}

/// Splits a line at its blanks.
FixtureScript::Words wordsOf(const std::string &line)
{
    FixtureScript::Words words;
    std::istringstream rest(line);
    for (std::string word; rest >> std::quoted(word, '"', '\0') && word[0] != '#';)
        words.push_back(unescaped(word));
    return words;
}

std::string printable(const std::string &text)
{
    std::string result;
    for (const char character : text) {
        const auto byte = static_cast<unsigned char>(character);
        char escape[8] = {character};
        if (byte < 0x20 || byte == 0x7F)
            std::snprintf(escape, sizeof escape, "\\x%02X", byte);
        result += escape;
    }
    return result;
}

} // namespace

void reportMisuse(const std::string &reason)
{
    std::fprintf(stderr, "fixture misused: %s: %s\n", modulePath().c_str(), reason.c_str());
    std::fflush(stderr);
    endProcess(kFixtureMisused);
}

std::int32_t numberOf(const std::string &text)
{
    const bool isHexadecimal = text.rfind("0x", 0) == 0;
    char *end = nullptr;
    const long long value = std::strtoll(text.c_str(), &end, isHexadecimal ? 16 : 10);
    const auto number = static_cast<std::int32_t>(value);
    if (text.empty() || *end != '\0' ||
        (value != number && !(isHexadecimal && value == static_cast<std::uint32_t>(number))))
        reportMisuse("'" + text + "' is not a 32-bit number");
    return number;
}

float floatOf(const std::string &text)
{
    float value = 0;
    if (std::from_chars(text.data(), text.data() + text.size(), value).ec != std::errc())
        reportMisuse("'" + text + "' is not a number");
    return value;
}

std::string textOf(float value)
{
    char text[64] = {};
    return std::string(text, std::to_chars(text, text + sizeof text, value).ptr);
}

FixtureScript::FixtureScript(const FixtureWords &format)
{
    const std::filesystem::path module = std::filesystem::u8path(modulePath());
    subjects.push_back({module.stem().u8string(), 0, 0});
    std::ifstream file(std::filesystem::u8path(modulePath() + ".script"), std::ios::binary);
    exists = file.is_open();
    for (std::string line; std::getline(file, line);)
        if (Words words = wordsOf(line); !words.empty())
            add(std::move(words), format);
    subjects[0].name = text("name", 0, subjects[0].name);
}

void FixtureScript::add(Words words, const FixtureWords &format)
{
    const std::string key = words.front();
    words.erase(words.begin());
    const bool isOrder = holdsWord(kOrders, key) && !words.empty() && holdsWord(format.stages, words[0]);
    const bool isOfModule = isOrder || key == "trace" || holdsWord(format.moduleKeys, key);
    if (key == format.subjectKey)
        subjects.push_back({words.back(), format.subjectHasNumber ? numberOf(words[0]) : 0, subjects.size()});
    else if (!isOfModule && !holdsWord(format.subjectKeys, key))
        reportMisuse("unknown statement '" + key + ' ' + (words.empty() ? "" : words[0]) + "'");
    m_statements[{key, isOfModule ? 0 : subjects.size() - 1}].push_back(std::move(words));
}

std::vector<FixtureScript::Words> FixtureScript::all(const std::string &key, std::size_t place) const
{
    const auto found = m_statements.find({key, place});
    return found == m_statements.end() ? std::vector<Words>() : found->second;
}

std::string FixtureScript::text(const std::string &key, std::size_t place, const std::string &usual) const
{
    const std::vector<Words> found = all(key, place);
    return found.empty() ? usual : found.back().at(0);
}

std::int32_t FixtureScript::number(const std::string &key, std::size_t place, std::int32_t usual) const
{
    return has(key, place) ? numberOf(text(key, place, {})) : usual;
}

std::vector<FixtureScript::Words> FixtureScript::ordered(const char *key, const std::string &stage,
                                                         const FixtureSubject &subject,
                                                         std::size_t least) const
{
    std::vector<Words> found = all(key);
    const auto isOfOther = [&](const Words &words) {
        const bool isOfAll = words.size() <= least;
        return words[0] != stage ||
               !(isOfAll || words.back() == subject.name ||
                 (subject.number != 0 && words.back() == std::to_string(subject.number)));
    };
    found.erase(std::remove_if(found.begin(), found.end(), isOfOther), found.end());
    return found;
}

void FixtureScript::reach(const std::string &stage, const FixtureSubject &subject,
                          const std::string &detail) const
{
    note(stage, subject, detail);
    for (const Words &words : ordered("effect", stage, subject, 3))
        if (!causeSideEffect(words.at(1), words.size() > 2 ? words[2] : ""))
            reportMisuse("the side effect '" + words[1] + "' is not possible here");
    for (const Words &words : ordered("delay", stage, subject))
        std::this_thread::sleep_for(std::chrono::milliseconds(numberOf(words.at(1))));
    for (const Words &words : ordered("fault", stage, subject))
        if (!commitFault(words.at(1)))
            reportMisuse("there is no fault '" + words[1] + "'");
}

void FixtureScript::note(const std::string &stage, const FixtureSubject &subject,
                         const std::string &detail) const
{
    for (const Words &trace : all("trace")) {
        std::string line = (trace.size() > 1 ? trace[1] + ' ' : "") + stage;
        line += (subject.name.empty() ? "" : ' ' + subject.name) + (detail.empty() ? "" : ": " + detail);
        if (!appendToFile(trace.at(0), printable(line) + '\n'))
            reportMisuse("cannot write the trace file '" + trace[0] + "'");
    }
}

std::string FixtureScript::answer(const std::string &stage, const FixtureSubject &subject) const
{
    const std::vector<Words> answers = ordered("answer", stage, subject);
    return answers.empty() ? "" : answers.front().at(1);
}
