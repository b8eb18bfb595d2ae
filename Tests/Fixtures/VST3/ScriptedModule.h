#pragma once

#include "Tests/Fixtures/FixtureStages.h"

#include <pluginterfaces/base/funknown.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

/// One audio bus of a scripted class.
struct ScriptedBus {
    std::int32_t channels = 0;
    std::int32_t type = 0; ///< 0 main, 1 auxiliary; anything else is a lie on purpose
};

/// One class of the scripted module. Texts are bytes; they are cut where the SDK's field ends, and then have
/// no terminator.
struct ScriptedClass {
    std::string name;
    std::string category = "Audio Module Class";
    std::string subCategories = "Fx";
    std::string vendor;
    std::string version = "1.0.0";
    Steinberg::FUID id;
    std::vector<ScriptedBus> inputs = {{2, 0}};
    std::vector<ScriptedBus> outputs = {{2, 0}};
    std::optional<std::int32_t>
        statedInputs; ///< the count of buses that is claimed, where it is not the true one
    std::optional<std::int32_t> statedOutputs;
    std::string controller; ///< "self", or the name of the class that is the edit controller; empty: none
    std::optional<std::string> state; ///< what its instances give as their state, first
};

/// All that the script beside the module says.
struct ScriptedModule {
    ScriptedModule();

    std::string vendor = "Fixture Works";
    int generation = 3; ///< the highest IPluginFactory interface that is answered; 0: none
    std::vector<ScriptedClass> classes;
    FixtureStages stages;

    /// The class of a name, or null.
    const ScriptedClass *classWithName(const std::string &name) const;
    /// The result code that the script has for a stage, else kResultOk.
    Steinberg::tresult result(const std::string &stage, const std::string &className = {}) const;
    /// Whether the script has exactly this answer for a stage.
    bool answers(const std::string &answer, const std::string &stage,
                 const std::string &className = {}) const;
};

/// This module's script, read on first use. A script that cannot be understood ends the process.
const ScriptedModule &scriptedModule();
