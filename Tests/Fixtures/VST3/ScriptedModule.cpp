#include "Tests/Fixtures/VST3/ScriptedModule.h"

#include "Tests/Fixtures/FixturePlatform.h"
#include "Tests/Fixtures/VST3/ScriptedClassReader.h"

using namespace Steinberg;

namespace {

std::vector<FixtureStage> stagesOfVST3()
{
    return {{"static-constructor"},
            {"module-entry", true},
            {"get-factory", true},
            {"set-host-context", true},
            {"factory-info", true},
            {"count-classes", true},
            {"class-info", true},
            {"class-info2", true},
            {"class-info-unicode", true},
            {"create-instance", true},
            {"set-io-mode", true},
            {"initialize", true},
            {"controller-class-id", true},
            {"set-component-handler", true},
            {"connect", true},
            {"get-state", true},
            {"set-component-state", true},
            {"set-state", true},
            {"disconnect", true},
            {"bus-count"},
            {"bus-info", true},
            {"terminate", true},
            {"release"},
            {"factory-release"},
            {"module-exit", true},
            {"static-destructor"}};
}

bool takeFactoryStatement(ScriptedModule &module, const ScriptStatement &statement)
{
    if (statement.key == "generation") {
        module.generation = statement.number(0);
        if (module.generation < 0 || module.generation > 3)
            statement.fail("a generation is 0 to 3");
    } else if (statement.key == "factory-vendor")
        module.vendor = statement.word(0);
    else
        return false;
    statement.allowWords(1);
    return true;
}

void takeStatement(ScriptedModule &module, const ScriptStatement &statement)
{
    if (module.stages.take(statement) || takeFactoryStatement(module, statement))
        return;
    if (statement.key == "class")
        module.classes.push_back(scriptedClass(statement.word(0)));
    else if (module.classes.empty() || !takeClassStatement(module.classes.back(), statement))
        statement.fail("unknown here");
}

/// A result by its name, since the numbers differ between platforms, or by its number.
tresult resultOf(const std::string &text)
{
    const std::pair<const char *, tresult> names[] = {{"ok", kResultOk},
                                                      {"null", kResultOk},
                                                      {"false", kResultFalse},
                                                      {"no-interface", kNoInterface},
                                                      {"internal-error", kInternalError}};
    for (const auto &[name, result] : names) {
        if (text == name)
            return result;
    }
    return numberOfAnswer(text);
}

} // namespace

ScriptedModule::ScriptedModule()
    : stages(stagesOfVST3())
{
    const auto statements = moduleStatements();
    if (!statements)
        classes.push_back(scriptedClass(baseName(modulePath())));
    for (const ScriptStatement &statement : statements.value_or(std::vector<ScriptStatement>()))
        takeStatement(*this, statement);
}

const ScriptedClass *ScriptedModule::classWithName(const std::string &name) const
{
    for (const ScriptedClass &described : classes) {
        if (described.name == name)
            return &described;
    }
    return nullptr;
}

tresult ScriptedModule::result(const std::string &stage, const std::string &className) const
{
    const std::string *answer = stages.answer(stage, className);
    return answer ? resultOf(*answer) : kResultOk;
}

bool ScriptedModule::answers(const std::string &answer, const std::string &stage,
                             const std::string &className) const
{
    const std::string *scripted = stages.answer(stage, className);
    return scripted && *scripted == answer;
}

const ScriptedModule &scriptedModule() { return moduleScript<ScriptedModule>(); }
