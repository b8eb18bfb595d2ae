#pragma once

#include <cstdint>
#include <optional>
#include <string>

/// What a call concerns: a class, an effect or a sub-plug-in.
struct FixtureSubject {
    FixtureSubject() = default;
    FixtureSubject(std::string subjectName, std::optional<std::int32_t> subjectNumber = std::nullopt);

    std::string name; ///< empty where the call concerns none
    std::optional<std::int32_t> number;
};

/// The subject that a statement is limited to, as the script's word for it: a name, or a number.
class FixtureSubjectFilter {
public:
    FixtureSubjectFilter() = default;
    /// An empty word admits every subject.
    explicit FixtureSubjectFilter(std::string word);

    bool admits(const FixtureSubject &subject) const;

private:
    std::string m_word;
    std::optional<std::int32_t> m_number; ///< the word's value where it is a number
};
