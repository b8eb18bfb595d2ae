#pragma once

#include "Tests/Fixtures/FixtureStages.h"
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
    std::string answer(audioMasterCallback host, AEffect *effect) const
    {
        return std::to_string(host(effect, opcode, index, value, nullptr, opt));
    }
    /// How the trace names the call.
    std::string traceName() const { return "host-" + std::to_string(opcode); }
};

/// One sub-plug-in of a scripted shell.
struct ScriptedChild {
    std::int32_t id = 0;
    ScriptedText listedName;
    EffectScript effect;
};

/// All that the script beside the module says.
struct PluginScript {
    PluginScript();

    /// What a shell answers after its last child.
    enum class AfterChildren {
        End,
        Endless, ///< a new child each time
        Repeat   ///< the children once more
    };

    EffectScript effect; ///< the plug-in itself; for a shell, the shell
    std::vector<ScriptedChild> children;
    AfterChildren afterChildren = AfterChildren::End;
    std::vector<HostCall> hostCalls;
    FixtureStages stages;

    bool isShell() const { return !children.empty() || afterChildren != AfterChildren::End; }
    /// The first child with this identifier. An endless shell has one for each.
    std::optional<ScriptedChild> childWithId(std::int32_t id) const;
    /// How the script and the trace call the plug-in itself.
    FixtureSubject subject() const { return FixtureSubject(effect.name.bytes); }
    /// The number that the script has as the answer at a stage, else `usual`.
    VstIntPtr result(const std::string &stage, const FixtureSubject &subject, VstIntPtr usual) const;
};

/// A child as a shell makes it up.
ScriptedChild makeChild(std::int32_t id, const ScriptedText &name);

/// This module's script, read on first use. A script that cannot be understood ends the process.
const PluginScript &pluginScript();
