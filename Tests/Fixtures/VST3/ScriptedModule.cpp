#include "Tests/Fixtures/VST3/ScriptedModule.h"

#include "Tests/Fixtures/FixturePlatform.h"

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

/// The same for the same name everywhere; FNV-1a.
std::uint64_t hashOf(const std::string &text, std::uint64_t start)
{
    std::uint64_t hash = start;
    for (const char character : text)
        hash = (hash ^ static_cast<unsigned char>(character)) * 0x100000001B3u;
    return hash;
}

FUID idFromName(const std::string &name)
{
    const std::uint64_t first = hashOf(name, 0xCBF29CE484222325u);
    const std::uint64_t second = hashOf(name, first);
    return FUID(static_cast<uint32>(first >> 32), static_cast<uint32>(first),
                static_cast<uint32>(second >> 32), static_cast<uint32>(second));
}

/// Takes the digits as FUID prints them, so that a test finds them again in the catalogue on any platform.
FUID idFromDigits(const ScriptStatement &statement)
{
    const std::string &digits = statement.word(0);
    FUID id;
    if (digits.size() != 32 || digits.find_first_not_of("0123456789ABCDEFabcdef") != std::string::npos ||
        !id.fromString(digits.c_str()))
        statement.fail("an id has 32 hexadecimal digits");
    return id;
}

std::int32_t busType(const std::string &text)
{
    if (text == "main")
        return 0;
    return text == "aux" ? 1 : parseNumber(text);
}

/// Reads "channels" or "channels:type" for each bus.
std::vector<ScriptedBus> readBuses(const ScriptStatement &statement)
{
    std::vector<ScriptedBus> buses;
    for (const std::string &word : statement.words) {
        const std::size_t colon = word.find(':');
        ScriptedBus bus;
        bus.channels = parseNumber(word.substr(0, colon));
        bus.type = colon == std::string::npos ? 0 : busType(word.substr(colon + 1));
        buses.push_back(bus);
    }
    return buses;
}

ScriptedClass scriptedClass(const std::string &name)
{
    ScriptedClass described;
    described.name = name;
    described.id = idFromName(name);
    return described;
}

/// Takes a statement that describes a class; false when the key is none of a class.
bool takeClassStatement(ScriptedClass &described, const ScriptStatement &statement)
{
    using Number = std::optional<std::int32_t>;
    if (statement.take<std::string>({{"category", &described.category},
                                     {"subcategories", &described.subCategories},
                                     {"vendor", &described.vendor},
                                     {"controller", &described.controller},
                                     {"version", &described.version}}) ||
        statement.take<std::optional<std::string>>({{"state", &described.state}}) ||
        statement.take<Number>(
            {{"stated-inputs", &described.statedInputs}, {"stated-outputs", &described.statedOutputs}}))
        return true;
    if (statement.key == "inputs")
        described.inputs = readBuses(statement);
    else if (statement.key == "outputs")
        described.outputs = readBuses(statement);
    else if (statement.key == "id")
        described.id = idFromDigits(statement);
    else
        return false;
    return true;
}

bool takeFactoryStatement(ScriptedModule &module, const ScriptStatement &statement)
{
    const bool taken = statement.take<std::string>({{"factory-vendor", &module.vendor}}) ||
                       statement.take<int>({{"generation", &module.generation}});
    if (module.generation < 0 || module.generation > 3)
        statement.fail("a generation is 0 to 3");
    return taken;
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
