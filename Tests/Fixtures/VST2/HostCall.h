#pragma once

#include "Tests/Fixtures/VST2/EffectScript.h"

/// One call of the host's callback that a script asks for.
struct HostCall {
    enum class Caller {
        SameThread,
        OtherThread, ///< one that is joined before the plug-in goes on
        UntilClose   ///< one that calls again and again until the effect is closed
    };

    std::string stage;
    std::int32_t opcode = 0;
    std::int32_t index = 0;
    std::int32_t value = 0;
    float opt = 0;
    Caller caller = Caller::SameThread;
    int depth = 1; ///< how many of this thread's calls the host has active then, this one counted

    /// Calls once; the result as one line of text.
    std::string answer(audioMasterCallback host, AEffect *effect) const;
    /// How the trace names the call.
    std::string traceName() const { return "host-" + std::to_string(opcode); }
};

/// Reads STAGE OPCODE and the named options behind them. Throws ScriptError.
HostCall readHostCall(const ScriptStatement &statement);
