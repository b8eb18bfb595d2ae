#pragma once

#include "Tests/Fixtures/FixtureMisuse.h"

#include <cstdint>
#include <initializer_list>
#include <optional>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

/// A script that cannot be understood. The text names the line.
class ScriptError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// One statement of a script: its key and the words behind it.
struct ScriptStatement {
    int line = 0; ///< counted from 1
    std::string key;
    std::vector<std::string> words;

    /// The word at an index; throws ScriptError when the statement has fewer.
    const std::string &word(std::size_t index) const;
    /// The word at an index, or an empty text.
    std::string optionalWord(std::size_t index) const;
    /// The word at an index as a 32-bit number, decimal or with 0x; a hexadecimal one may set the top bit.
    std::int32_t number(std::size_t index) const;
    /// Throws ScriptError when the statement has more words than this.
    void allowWords(std::size_t most) const;
    /// Puts the one word of a statement whose key is among these where it belongs; false for another key.
    /// Throws ScriptError.
    template <typename Value>
    bool take(std::initializer_list<std::pair<const char *, Value *>> known) const
    {
        for (const auto &[name, value] : known) {
            if (key != name)
                continue;
            if constexpr (std::is_convertible_v<std::string, Value>)
                *value = word(0);
            else
                *value = number(0);
            allowWords(1);
            return true;
        }
        return false;
    }
    /// Throws ScriptError for this statement.
    [[noreturn]] void fail(const std::string &reason) const;
};

/// Splits a script into its statements: one per line, words between blanks, texts with blanks in double
/// quotes, \xHH \n \t \\ \" for bytes that cannot stand as they are, `#` in front of a comment. Throws
/// ScriptError.
std::vector<ScriptStatement> parseScript(const std::string &script);

/// The statements of the script beside this module; none without a script. Throws ScriptError.
std::optional<std::vector<ScriptStatement>> moduleStatements();

/// A text as a 32-bit number as ScriptStatement::number reads it; throws ScriptError.
std::int32_t parseNumber(const std::string &text);
/// The same of an answer. It is read when it is due, in the middle of a call, and must not throw into the
/// host: one that is no number ends the process.
std::int32_t numberOfAnswer(const std::string &answer);

/// The file name of a path without its ending: what a plug-in without a script is called.
std::string baseName(const std::string &path);

/// What the script says of the module, read on first use. One that cannot be understood ends the process.
template <typename Script>
const Script &moduleScript()
{
    static const Script script = [] {
        try {
            return Script();
        } catch (const ScriptError &error) {
            reportMisuse(error.what());
        }
    }();
    return script;
}
