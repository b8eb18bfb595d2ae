#include "Tests/Fixtures/VST2/VST2Script.h"

#include <algorithm>
#include <map>
#include <utility>

namespace {

const int kOpcodes = 128; ///< those from here on are no stages
/// The most bytes of a chunk that a trace shows.
const VstIntPtr kShownBytes = 64;

/// Constant, since static constructors of other files read it.
constexpr std::pair<int, const char *> kStages[] = {
    {effOpen, "open"},
    {effClose, "close"},
    {effGetParamName, "get-param-name"},
    {effMainsChanged, "mains-changed"},
    {VstPublished::effEditIdle, "edit-idle"},
    {effGetChunk, "get-chunk"},
    {effSetChunk, "set-chunk"},
    {effGetPlugCategory, "get-plug-category"},
    {effSetSpeakerArrangement, "set-speaker-arrangement"},
    {effGetEffectName, "get-effect-name"},
    {effGetVendorString, "get-vendor-string"},
    {VstPublished::effGetParameterProperties, "get-param-properties"},
    {effShellGetNextPlugin, "shell-next"}};

/// "TYPE(SPEAKERS…)".
std::string arrangementText(const void *pointer)
{
    const auto *arrangement = static_cast<const VstSpeakerArrangement *>(pointer);
    if (!arrangement)
        return "null";
    std::string text = std::to_string(arrangement->type) + "(";
    for (int index = 0; index < arrangement->numChannels; ++index)
        text += (index ? " " : "") + std::to_string(arrangement->speakers[index].type);
    return text + ")";
}

FixtureWords wordsOfVST2()
{
    std::string stages = "static-constructor entry get-parameter set-parameter process static-destructor";
    for (int opcode = 0; opcode < kOpcodes; ++opcode)
        stages += ' ' + stageOf(opcode);
    return {"child", true,
            "name vendor id magic category inputs outputs flags parameter stated-parameters chunk null-chunk "
            "editor new-outputs own-thread",
            "after-children", stages};
}

} // namespace

const FixtureScript &script()
{
    static const FixtureScript script(wordsOfVST2());
    return script;
}

bool isShell() { return script().subjects.size() > 1 || !afterChildren().empty(); }

std::string afterChildren() { return script().text("after-children", 0, {}); }

std::string stageOf(int opcode)
{
    for (const auto &[named, stage] : kStages)
        if (opcode == named)
            return stage;
    return "opcode-" + std::to_string(opcode);
}

bool needsPointer(int opcode)
{
    const int opcodes[] = {effGetParamName,    effGetChunk,
                           effSetChunk,        effGetEffectName,
                           effGetVendorString, effShellGetNextPlugin,
                           effEditGetRect,     effGetProgramName,
                           effCanDo,           VstPublished::effGetParameterProperties};
    return std::find(std::begin(opcodes), std::end(opcodes), opcode) != std::end(opcodes);
}

std::string detailOf(int opcode, int index, VstIntPtr value, const void *pointer, float opt)
{
    if (opcode == effSetSampleRate)
        return textOf(opt);
    if (opcode == effSetSpeakerArrangement)
        return arrangementText(reinterpret_cast<const void *>(value)) + " -> " + arrangementText(pointer);
    if (index == 0 && value == 0)
        return {};
    std::string detail = std::to_string(index) + " " + std::to_string(value);
    if (opcode == effSetChunk)
        detail.append(" ").append(static_cast<const char *>(pointer),
                                  static_cast<std::size_t>(std::clamp<VstIntPtr>(value, 0, kShownBytes)));
    return detail;
}

HostCall::HostCall(const FixtureScript::Words &words)
    : opcode(numberOf(words.at(1)))
{
    const std::map<std::string, int *> numbers = {{"index", &index}, {"value", &value}, {"nested", &depth}};
    for (std::size_t place = 2; place < words.size(); ++place) {
        const std::string &option = words[place];
        if (option == "from-thread")
            fromThread = true;
        else if (option == "until-close")
            untilClose = true;
        else if (option == "opt")
            opt = floatOf(words.at(++place));
        else if (numbers.count(option) != 0)
            *numbers.at(option) = numberOf(words.at(++place));
        else
            reportMisuse("unknown option '" + option + "'");
    }
}
