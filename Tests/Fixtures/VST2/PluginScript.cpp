#include "Tests/Fixtures/VST2/PluginScript.h"

#include "Tests/Fixtures/FixturePlatform.h"
#include "Tests/Fixtures/VST2/Opcodes.h"

namespace {

/// The longest name of a child, terminator included; whether it suits the host's buffer, the test must know.
const std::size_t kChildName = 1024;

PluginScript::AfterChildren readAfterChildren(const ScriptStatement &statement)
{
    statement.allowWords(1);
    if (statement.word(0) == "endless")
        return PluginScript::AfterChildren::Endless;
    if (statement.word(0) == "repeat")
        return PluginScript::AfterChildren::Repeat;
    statement.fail("neither 'endless' nor 'repeat'");
}

bool takeFlag(HostCall &call, const std::string &word)
{
    if (word == "from-thread")
        call.caller = HostCall::Caller::OtherThread;
    else if (word == "until-close")
        call.caller = HostCall::Caller::UntilClose;
    else
        return false;
    return true;
}

/// Takes the option whose value stands at `index`.
void takeOption(HostCall &call, const ScriptStatement &statement, std::size_t index)
{
    const std::string &option = statement.words[index - 1];
    if (option == "index")
        call.index = statement.number(index);
    else if (option == "value")
        call.value = statement.number(index);
    else if (option == "opt")
        call.opt = readFloat(statement, index);
    else if (option == "nested")
        call.depth = statement.number(index);
    else
        statement.fail("no option '" + option + "'");
}

/// Reads STAGE OPCODE and the named options behind them.
HostCall readHostCall(const ScriptStatement &statement, const FixtureStages &stages)
{
    HostCall call;
    call.stage = statement.word(0);
    call.opcode = statement.number(1);
    for (std::size_t index = 2; index < statement.words.size(); ++index) {
        if (!takeFlag(call, statement.words[index]))
            takeOption(call, statement, ++index);
    }
    if (call.depth < 1)
        statement.fail("one call at least");
    if (call.depth > 1 && call.caller == HostCall::Caller::UntilClose)
        statement.fail("a call that is kept up does not nest");
    if (!stages.findStage(call.stage) || call.stage.rfind("static-", 0) == 0)
        statement.fail("no effect to call from at '" + call.stage + "'");
    return call;
}

void takeStatement(PluginScript &plugin, const ScriptStatement &statement)
{
    if (plugin.stages.take(statement))
        return;
    EffectScript &described = plugin.children.empty() ? plugin.effect : plugin.children.back().effect;
    if (statement.key == "child")
        plugin.children.push_back(makeChild(statement.number(0), readText(statement, 1, kChildName)));
    else if (statement.key == "after-children")
        plugin.afterChildren = readAfterChildren(statement);
    else if (statement.key == "ask-host")
        plugin.hostCalls.push_back(readHostCall(statement, plugin.stages));
    else if (!takeEffectStatement(described, statement))
        statement.fail("unknown");
}

} // namespace

PluginScript::PluginScript()
    : stages(stagesOfVST2())
{
    effect.name.bytes = baseName(modulePath());
    for (const ScriptStatement &statement : moduleStatements().value_or(std::vector<ScriptStatement>()))
        takeStatement(*this, statement);
}

std::optional<ScriptedChild> PluginScript::childWithId(std::int32_t id) const
{
    for (const ScriptedChild &child : children) {
        if (child.id == id)
            return child;
    }
    if (afterChildren == AfterChildren::Endless)
        return makeChild(id, {"Endless " + std::to_string(id)});
    return std::nullopt;
}

VstIntPtr PluginScript::result(const std::string &stage, const FixtureSubject &subject, VstIntPtr usual) const
{
    const std::string *answer = stages.answer(stage, subject);
    return answer ? numberOfAnswer(*answer) : usual;
}

ScriptedChild makeChild(std::int32_t id, const ScriptedText &name)
{
    ScriptedChild child;
    child.id = id;
    child.listedName = name;
    child.effect.name = name;
    child.effect.uniqueId = id;
    return child;
}

const PluginScript &pluginScript() { return moduleScript<PluginScript>(); }
