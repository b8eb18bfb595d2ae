#include "Tests/Fixtures/VST2/HostCall.h"

#include <algorithm>
#include <vector>

namespace {

const std::size_t kBufferSize = 1024;
/// What the buffer holds before, so that each byte that the host writes is seen.
const char kUntouched = '\x5A';

std::string describeWritten(const std::vector<char> &buffer)
{
    const auto untouched = [](char byte) { return byte == kUntouched; };
    const auto end = std::find_if_not(buffer.rbegin(), buffer.rend(), untouched).base();
    const std::string text(buffer.begin(), std::find(buffer.begin(), end, '\0'));
    return " \"" + text + "\" in " + std::to_string(end - buffer.begin()) + " bytes";
}

bool takeFlag(HostCall &call, const std::string &word)
{
    if (word == "buffer")
        call.givesBuffer = true;
    else if (word == "null-effect")
        call.withEffect = false;
    else if (word == "from-thread")
        call.caller = HostCall::Caller::OtherThread;
    else if (word == "until-close")
        call.caller = HostCall::Caller::UntilClose;
    else if (word == "until-unload")
        call.caller = HostCall::Caller::UntilUnload;
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
    else if (option == "text")
        call.text = statement.word(index);
    else if (option == "nested")
        call.depth = statement.number(index);
    else if (option == "for")
        call.subject = FixtureSubjectFilter(statement.word(index));
    else
        statement.fail("no option '" + option + "'");
}

} // namespace

std::string HostCall::answer(audioMasterCallback host, AEffect *effect) const
{
    std::vector<char> buffer(kBufferSize, kUntouched);
    std::string handedText = text.value_or(std::string());
    void *pointer = text ? handedText.data() : nullptr;
    if (givesBuffer)
        pointer = buffer.data();
    const VstIntPtr result = host(withEffect ? effect : nullptr, opcode, index, value, pointer, opt);
    return std::to_string(result) + (givesBuffer ? describeWritten(buffer) : std::string());
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
    if (call.text && call.givesBuffer)
        statement.fail("a text and a buffer");
    if (call.depth < 1 || (call.depth > 1 && !call.withEffect))
        statement.fail("calls nest by way of the effect");
    if (call.depth > 1 && call.isKeptUp())
        statement.fail("a call that is kept up does not nest");
    return call;
}
