#pragma once

#include "Tests/Fixtures/FixtureStages.h"
#include "Tests/Fixtures/VST2/HostCall.h"

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
