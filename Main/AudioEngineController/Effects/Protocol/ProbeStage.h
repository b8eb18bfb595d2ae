#pragma once

/// What a plug-in is being asked. Stages follow each other in this order; a shell goes through the middle
/// ones again for each of its sub-plug-ins.
enum class ProbeStage {
    Load,  ///< its library is being loaded
    Start, ///< the module's entry function, or the VST 2 entry point, runs
    Ask,   ///< it is asked for its data
    Close, ///< it is released and unloaded
};

/// What the plug-in was doing, behind "it crashed" and the like.
inline const char *duringStage(ProbeStage stage)
{
    switch (stage) {
    case ProbeStage::Load:
        return " while it was being loaded";
    case ProbeStage::Start:
        return " when it was started";
    case ProbeStage::Ask:
        return " while it was asked for its data";
    case ProbeStage::Close:
        return " while it was being closed and unloaded";
    }
    return "";
}
