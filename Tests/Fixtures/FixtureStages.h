#pragma once

#include "Tests/Fixtures/FixtureScript.h"
#include "Tests/Fixtures/FixtureSubject.h"
#include "Tests/Fixtures/FixtureTrace.h"

#include <string>
#include <vector>

/// A point in a plug-in's life at which the host calls it.
struct FixtureStage {
    std::string name;
    bool takesAnswer = false; ///< whether a script may choose what the call returns
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
    /// Writes a trace line only.
    void note(const std::string &stage, const FixtureSubject &subject, const std::string &detail) const;
    /// The scripted answer for a stage and subject, or null.
    const std::string *answer(const std::string &stage, const FixtureSubject &subject = {}) const;
    /// Whether the format has this stage.
    bool knows(const std::string &stage) const;

private:
    enum class Kind { SideEffect, Delay, Fault, Answer };
    struct Order {
        Kind kind = Kind::Fault;
        std::string stage;
        FixtureSubjectFilter subject;
        std::string what;  ///< the kind of fault or side effect, or the answer
        std::string value; ///< of a side effect
        int milliseconds = 0;

        bool concerns(const std::string &atStage, const FixtureSubject &atSubject) const;
    };

    /// The stage of a name, or null.
    const FixtureStage *findStage(const std::string &name) const;
    void checkStage(const ScriptStatement &statement, Kind kind) const;
    Order readOrder(const ScriptStatement &statement, Kind kind) const;
    void takeTrace(const ScriptStatement &statement);
    void carryOut(const Order &order) const;

    std::vector<FixtureStage> m_known;
    std::vector<Order> m_orders;
    FixtureTrace m_trace;
};
