#include "Tests/Fixtures/VST2/HostCall.h"

namespace {

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

} // namespace

std::string HostCall::answer(audioMasterCallback host, AEffect *effect) const
{
    return std::to_string(host(effect, opcode, index, value, nullptr, opt));
}

HostCall readHostCall(const ScriptStatement &statement)
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
    return call;
}
