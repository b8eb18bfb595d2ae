#pragma once

#include "Tests/Fixtures/FixtureFaults.h"
#include "Tests/Fixtures/FixtureScript.h"

#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

/// A point in a plug-in's life at which the host calls it.
struct FixtureStage {
    std::string name;
    bool takesAnswer = false; ///< whether a script may choose what the call returns
};

/// What a call concerns: a class, an effect or a sub-plug-in.
struct FixtureSubject {
    FixtureSubject() = default;
    FixtureSubject(std::string subjectName, std::optional<std::int32_t> subjectNumber = std::nullopt)
        : name(std::move(subjectName))
        , number(subjectNumber)
    {}

    std::string name; ///< empty where the call concerns none
    std::optional<std::int32_t> number;
};

/// What a script asks for at the stages of a plug-in's life, whatever its format: trace lines, side effects,
/// delays, faults and answers.
class FixtureStages {
public:
    /// `known` holds the format's stages; a script may name no other.
    explicit FixtureStages(std::vector<FixtureStage> known);

    /// Takes a statement; false when its key is not one of those handled here. Throws ScriptError.
    bool take(const ScriptStatement &statement);

    /// Tells that the module is called: writes the trace line, then causes the side effects, the delays and
    /// the fault that the script has for this stage and subject.
    void reach(const std::string &stage, const FixtureSubject &subject = {},
               const std::string &detail = {}) const;
    /// Writes a trace line only: "stage", "stage subject", "stage: detail" or "stage subject: detail", with
    /// control characters as \xHH. It is in the file before the call goes on.
    void note(const std::string &stage, const FixtureSubject &subject, const std::string &detail) const;
    /// The scripted answer for a stage and subject, or null.
    const std::string *answer(const std::string &stage, const FixtureSubject &subject = {}) const;
    /// The stage of a name, or null.
    const FixtureStage *findStage(const std::string &name) const;

private:
    enum class Kind { SideEffect, Delay, Fault, Answer };
    struct Order {
        Kind kind = Kind::Fault;
        std::string stage;
        FixtureSubject subject;       ///< as the script names it, by name or number; empty: every one
        std::string what;             ///< the kind of fault or side effect, or the answer
        std::string value;            ///< of a side effect
        FixtureFault fault = nullptr; ///< where it is one
        const FixtureSideEffect *sideEffect = nullptr; ///< where it is one
        int milliseconds = 0;

        bool concerns(const std::string &atStage, const FixtureSubject &atSubject) const;
        void carryOut() const;
    };

    Order readOrder(const ScriptStatement &statement, Kind kind) const;

    std::vector<FixtureStage> m_known;
    std::vector<Order> m_orders;
    std::string m_tracePath;   ///< empty: no trace
    std::string m_tracePrefix; ///< for a file that several modules write to
};
