#include "Tests/Fixtures/FixtureStages.h"

#include "Tests/Fixtures/FixtureMisuse.h"
#include "Tests/Fixtures/FixturePlatform.h"

#include <algorithm>
#include <cstdio>

namespace {

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

std::optional<std::int32_t> numberOf(const std::string &word)
{
    try {
        return parseNumber(word);
    } catch (const ScriptError &) {
        return std::nullopt; // a name
    }
}

} // namespace

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
    statement.allowWords(2);
    m_tracePath = statement.word(0);
    m_tracePrefix = statement.words.size() > 1 ? statement.words[1] + " " : "";
    return true;
}

void FixtureStages::reach(const std::string &stage, const FixtureSubject &subject,
                          const std::string &detail) const
{
    note(stage, subject, detail);
    for (const Kind kind : {Kind::SideEffect, Kind::Delay, Kind::Fault}) {
        for (const Order &order : m_orders) {
            if (order.kind == kind && order.concerns(stage, subject))
                order.carryOut();
        }
    }
}

void FixtureStages::note(const std::string &stage, const FixtureSubject &subject,
                         const std::string &detail) const
{
    if (m_tracePath.empty())
        return;
    std::string line = m_tracePrefix + stage;
    if (!subject.name.empty())
        line += " " + subject.name;
    if (!detail.empty())
        line += ": " + detail;
    if (!appendToFile(m_tracePath, printable(line) + "\n"))
        reportMisuse("cannot write the trace file '" + m_tracePath + "'");
}

const std::string *FixtureStages::answer(const std::string &stage, const FixtureSubject &subject) const
{
    for (const Order &order : m_orders) {
        if (order.kind == Kind::Answer && order.concerns(stage, subject))
            return &order.what;
    }
    return nullptr;
}

const FixtureStage *FixtureStages::findStage(const std::string &name) const
{
    const auto stage = std::find_if(m_known.begin(), m_known.end(),
                                    [&name](const FixtureStage &entry) { return entry.name == name; });
    return stage == m_known.end() ? nullptr : &*stage;
}

FixtureStages::Order FixtureStages::readOrder(const ScriptStatement &statement, Kind kind) const
{
    Order order;
    order.kind = kind;
    order.stage = statement.word(0);
    order.what = statement.word(1);
    std::size_t read = 2;
    const FixtureStage *stage = findStage(order.stage);
    if (!stage || (kind == Kind::Answer && !stage->takesAnswer))
        statement.fail("no stage '" + order.stage + "', or none that takes this");
    if (kind == Kind::Fault && !(order.fault = findFault(order.what)))
        statement.fail("no fault '" + order.what + "'");
    if (kind == Kind::SideEffect && !(order.sideEffect = findSideEffect(order.what)))
        statement.fail("no side effect '" + order.what + "'");
    if (order.sideEffect && order.sideEffect->takesValue)
        order.value = statement.word(read++);
    if (kind == Kind::Delay)
        order.milliseconds = statement.number(1);
    order.subject = {statement.optionalWord(read), numberOf(statement.optionalWord(read))};
    statement.allowWords(read + 1);
    return order;
}

bool FixtureStages::Order::concerns(const std::string &atStage, const FixtureSubject &atSubject) const
{
    return stage == atStage && (subject.name.empty() || subject.name == atSubject.name ||
                                (subject.number && subject.number == atSubject.number));
}

void FixtureStages::Order::carryOut() const
{
    if (sideEffect && !sideEffect->cause(value))
        reportMisuse("side effect '" + what + "' with '" + value + "' cannot be had here");
    sleepMilliseconds(milliseconds);
    if (fault)
        fault();
}
