#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <utility>
#include <vector>

/// The exit code of a process whose fixture was scripted wrongly or called against its rules, so that neither
/// passes for one of the faults that a test asked for.
inline constexpr int kFixtureMisused = 86;

/// Ends the process with kFixtureMisused and says why on the error output.
[[noreturn]] void reportMisuse(const std::string &reason);

/// Commits a fault as a broken plug-in would; most do not return. False where there is no such kind.
bool commitFault(const std::string &kind);
/// Changes the process's state as plug-ins do; false where there is no such kind or the value does not suit.
bool causeSideEffect(const std::string &kind, const std::string &value);

/// A 32-bit number, decimal or with 0x; a hexadecimal one may set the top bit. Anything else is a misuse.
std::int32_t numberOf(const std::string &text);
/// A decimal fraction, whatever the locale; "inf" and "nan" too.
float floatOf(const std::string &text);
std::string textOf(float value);

/// Copies a text into a field of a plug-in interface. A text that fills the field gets no terminator; what
/// lies behind a shorter one is left as it was. 1, as a plug-in answers that has written one.
template <typename Character, std::size_t Size>
int fill(Character (&field)[Size], const std::string &text)
{
    for (std::size_t place = 0; place < Size && place < text.size(); ++place)
        field[place] = static_cast<Character>(static_cast<unsigned char>(text[place]));
    if (text.size() < Size)
        field[text.size()] = 0;
    return 1;
}

/// What a call concerns: the module, one of its classes or one of its sub-plug-ins.
struct FixtureSubject {
    std::string name;
    std::int32_t number = 0;
    std::size_t place = 0; ///< among the script's subjects; 0 is the module
};

/// The words of a format's scripts, between blanks.
struct FixtureWords {
    std::string subjectKey;  ///< begins a class or sub-plug-in
    bool subjectHasNumber;   ///< whether a number stands before its name
    std::string subjectKeys; ///< describe the subject above them, or the module
    std::string moduleKeys;  ///< concern the module wherever they stand
    std::string stages;
};

/// The script beside the module, see README.md.
class FixtureScript {
public:
    using Words = std::vector<std::string>;

    /// Reads the script. A statement that the format does not know is a misuse.
    explicit FixtureScript(const FixtureWords &format);

    bool exists = false;                  ///< whether there is a script
    std::vector<FixtureSubject> subjects; ///< the module itself, then those of the script in order

    /// The words behind each statement of a key that describes a subject.
    std::vector<Words> all(const std::string &key, std::size_t place = 0) const;
    /// The first word of the last of them.
    std::string text(const std::string &key, std::size_t place, const std::string &usual) const;
    std::int32_t number(const std::string &key, std::size_t place, std::int32_t usual) const;
    bool has(const std::string &key, std::size_t place = 0) const { return !all(key, place).empty(); }

    /// Tells that the module is called: writes the trace line, then causes the side effects, the delays and
    /// the fault that the script has for this stage and subject.
    void reach(const std::string &stage, const FixtureSubject &subject = {},
               const std::string &detail = {}) const;
    /// Writes a trace line only; it is in the file before the call goes on.
    void note(const std::string &stage, const FixtureSubject &subject, const std::string &detail) const;
    /// The scripted answer for a stage and subject; empty where there is none.
    std::string answer(const std::string &stage, const FixtureSubject &subject = {}) const;

private:
    void add(Words words, const FixtureWords &format);
    /// The statements of a key that apply at this stage to this subject. Those of more than `least` words end
    /// with the subject's name or number; the others apply to all.
    std::vector<Words> ordered(const char *key, const std::string &stage, const FixtureSubject &subject,
                               std::size_t least = 2) const;

    /// By key and subject, so that a module may have thousands of classes.
    std::map<std::pair<std::string, std::size_t>, std::vector<Words>> m_statements;
};
