#include "Tests/Fixtures/FixtureTrace.h"

#include "Tests/Fixtures/FixtureMisuse.h"
#include "Tests/Fixtures/FixturePlatform.h"

#include <cstdio>
#include <utility>

namespace {

std::string printable(const std::string &text)
{
    std::string result;
    for (const char character : text) {
        const auto byte = static_cast<unsigned char>(character);
        char escape[8] = {};
        if (byte < 0x20 || byte == 0x7F)
            std::snprintf(escape, sizeof escape, "\\x%02X", byte);
        result += *escape ? std::string(escape) : std::string(1, character);
    }
    return result;
}

} // namespace

FixtureTrace::FixtureTrace(std::string path, const std::string &label)
    : m_path(std::move(path))
    , m_prefix(label.empty() ? std::string() : label + " ")
{}

void FixtureTrace::write(const std::string &stage, const std::string &subject,
                         const std::string &detail) const
{
    if (m_path.empty())
        return;
    std::string line = m_prefix + stage;
    if (!subject.empty())
        line += " " + subject;
    if (!detail.empty())
        line += ": " + detail;
    if (!appendToFile(m_path, printable(line) + "\n"))
        reportMisuse("cannot write the trace file '" + m_path + "'");
}
