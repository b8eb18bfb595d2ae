#pragma once

/// What a plug-in is being asked. Stages follow each other in this order; a shell goes through the middle
/// ones again for each of its sub-plug-ins.
enum class ProbeStage {
    Load,  ///< its library is being loaded
    Start, ///< the module's entry function, or the VST 2 entry point, runs
    Ask,   ///< it is asked for its data
    Close, ///< it is released and unloaded
};
