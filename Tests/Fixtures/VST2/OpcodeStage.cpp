#include "Tests/Fixtures/VST2/OpcodeStage.h"

#include "Main/AudioEngineController/Effects/VST/VSTInterface.h"

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
