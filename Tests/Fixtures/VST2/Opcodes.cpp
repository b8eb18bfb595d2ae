#include "Tests/Fixtures/VST2/Opcodes.h"

#include <algorithm>
#include <charconv>

namespace {

/// Opcodes from here on are no stages that a script can name.
const int kOpcodes = 128;

const struct {
    int opcode;
    const char *stage;
} kNamed[] = {{effOpen, "open"},
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

/// The most bytes of a chunk that a trace shows.
const VstIntPtr kShownBytes = 64;

/// "TYPE(SPEAKERS…)".
std::string arrangementText(const void *pointer)
{
    const auto *arrangement = static_cast<const VstSpeakerArrangement *>(pointer);
    if (!arrangement)
        return "null";
    std::string speakers;
    for (int index = 0; index < arrangement->numChannels; ++index)
        speakers += (index ? " " : "") + std::to_string(arrangement->speakers[index].type);
    return std::to_string(arrangement->type) + "(" + speakers + ")";
}

} // namespace

std::vector<FixtureStage> stagesOfVST2()
{
    std::vector<FixtureStage> stages = {{"static-constructor"}, {"entry", true},
                                        {"get-parameter"},      {"process"},
                                        {"set-parameter"},      {"static-destructor"}};
    for (int opcode = 0; opcode < kOpcodes; ++opcode)
        stages.push_back({stageOfOpcode(opcode), true});
    return stages;
}

std::string stageOfOpcode(int opcode)
{
    for (const auto &entry : kNamed) {
        if (opcode == entry.opcode)
            return entry.stage;
    }
    return "opcode-" + std::to_string(opcode);
}

bool needsPointer(int opcode)
{
    const int opcodes[] = {effGetParamName,       effGetChunk,
                           effSetChunk,           effGetEffectName,
                           effGetVendorString,    VstPublished::effGetParameterProperties,
                           effShellGetNextPlugin, effEditGetRect,
                           effGetProgramName,     effCanDo};
    return std::find(std::begin(opcodes), std::end(opcodes), opcode) != std::end(opcodes);
}

std::string callDetail(int opcode, int index, VstIntPtr value, const void *pointer, float opt)
{
    if (opcode == effSetSampleRate)
        return floatText(opt);
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

std::string floatText(float value)
{
    char text[64] = {};
    const auto result = std::to_chars(text, text + sizeof text, value);
    return std::string(text, result.ptr);
}
