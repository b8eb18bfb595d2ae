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

HostCall readKnownHostCall(const ScriptStatement &statement, const FixtureStages &stages)
{
    HostCall call = readHostCall(statement);
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
        plugin.hostCalls.push_back(readKnownHostCall(statement, plugin.stages));
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
