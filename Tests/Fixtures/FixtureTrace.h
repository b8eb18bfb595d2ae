#pragma once

#include <string>

/// Writes one line per call that a scripted plug-in receives; each is in the file before the call goes on.
class FixtureTrace {
public:
    FixtureTrace() = default;
    /// `label` stands in front of every line, for a file that several modules write to; may be empty.
    FixtureTrace(std::string path, const std::string &label);

    /// Writes "stage", "stage subject", "stage: detail" or "stage subject: detail". Control characters are
    /// written as \xHH. Does nothing without a file.
    void write(const std::string &stage, const std::string &subject, const std::string &detail) const;

private:
    std::string m_path;
    std::string m_prefix;
};
