#include "Tests/Fixtures/FixtureStages.h"

#include "Tests/Fixtures/FixtureFaults.h"
#include "Tests/Fixtures/FixtureMisuse.h"
#include "Tests/Fixtures/FixturePlatform.h"

#include <algorithm>
#include <utility>

FixtureStages::FixtureStages(std::vector<FixtureStage> known)
    : m_known(std::move(known))
{}

bool FixtureStages::take(const ScriptStatement &statement)
{
    const std::pair<const char *, Kind> kinds[] = {{"effect", Kind::SideEffect},
                                                   {"delay", Kind::Delay},
                                                   {"fault", Kind::Fault},
                                                   {"answer", Kind::Answer}};
    for (const auto &[key, kind] : kinds) {
        if (statement.key == key) {
            m_orders.push_back(readOrder(statement, kind));
            return true;
        }
    }
    if (statement.key != "trace")
        return false;
    takeTrace(statement);
    return true;
}

void FixtureStages::reach(const std::string &stage, const FixtureSubject &subject,
                          const std::string &detail) const
{
    m_trace.write(stage, subject.name, detail);
    for (const Kind kind : {Kind::SideEffect, Kind::Delay, Kind::Fault}) {
        for (const Order &order : m_orders) {
            if (order.kind == kind && order.concerns(stage, subject))
                carryOut(order);
        }
    }
}

void FixtureStages::note(const std::string &stage, const FixtureSubject &subject,
                         const std::string &detail) const
{
    m_trace.write(stage, subject.name, detail);
}

const std::string *FixtureStages::answer(const std::string &stage, const FixtureSubject &subject) const
{
    for (const Order &order : m_orders) {
        if (order.kind == Kind::Answer && order.concerns(stage, subject))
            return &order.what;
    }
    return nullptr;
}

bool FixtureStages::Order::concerns(const std::string &atStage, const FixtureSubject &atSubject) const
{
    return stage == atStage && subject.admits(atSubject);
}

bool FixtureStages::knows(const std::string &stage) const { return findStage(stage) != nullptr; }

const FixtureStage *FixtureStages::findStage(const std::string &name) const
{
    const auto stage = std::find_if(m_known.begin(), m_known.end(),
                                    [&name](const FixtureStage &entry) { return entry.name == name; });
    return stage == m_known.end() ? nullptr : &*stage;
}

void FixtureStages::checkStage(const ScriptStatement &statement, Kind kind) const
{
    const FixtureStage *stage = findStage(statement.word(0));
    if (!stage)
        statement.fail("no stage '" + statement.word(0) + "'");
    if (kind == Kind::Answer && !stage->takesAnswer)
        statement.fail("stage '" + stage->name + "' takes no answer");
}

FixtureStages::Order FixtureStages::readOrder(const ScriptStatement &statement, Kind kind) const
{
    Order order;
    order.kind = kind;
    order.stage = statement.word(0);
    order.what = statement.word(1);
    std::size_t read = 2;
    checkStage(statement, kind);
    if (kind == Kind::Fault && !isFault(order.what))
        statement.fail("no fault '" + order.what + "'");
    if (kind == Kind::SideEffect && !isSideEffect(order.what))
        statement.fail("no side effect '" + order.what + "'");
    if (kind == Kind::SideEffect && sideEffectTakesValue(order.what))
        order.value = statement.word(read++);
    if (kind == Kind::Delay)
        order.milliseconds = statement.number(1);
    order.subject = FixtureSubjectFilter(statement.optionalWord(read++));
    statement.allowWords(read);
    return order;
}

void FixtureStages::takeTrace(const ScriptStatement &statement)
{
    statement.allowWords(2);
    m_trace = FixtureTrace(statement.word(0), statement.optionalWord(1));
}

void FixtureStages::carryOut(const Order &order) const
{
    if (order.kind == Kind::SideEffect && !causeSideEffect(order.what, order.value))
        reportMisuse("side effect '" + order.what + "' with '" + order.value + "' cannot be had here");
    if (order.kind == Kind::Delay)
        sleepMilliseconds(order.milliseconds);
    if (order.kind == Kind::Fault)
        commitFault(order.what);
}
