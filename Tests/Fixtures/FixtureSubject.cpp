#include "Tests/Fixtures/FixtureSubject.h"

#include "Tests/Fixtures/FixtureScript.h"

#include <utility>

FixtureSubject::FixtureSubject(std::string subjectName, std::optional<std::int32_t> subjectNumber)
    : name(std::move(subjectName))
    , number(subjectNumber)
{}

FixtureSubjectFilter::FixtureSubjectFilter(std::string word)
    : m_word(std::move(word))
{
    try {
        m_number = parseNumber(m_word);
    } catch (const ScriptError &) {
        m_number.reset(); // a name
    }
}

bool FixtureSubjectFilter::admits(const FixtureSubject &subject) const
{
    return m_word.empty() || m_word == subject.name || (m_number && m_number == subject.number);
}
