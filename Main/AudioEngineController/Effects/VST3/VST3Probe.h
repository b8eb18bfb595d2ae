#pragma once

#include "Main/AudioEngineController/Effects/Protocol/Probe.h"

/// Lists the audio classes of VST 3 modules.
///
/// A class that cannot be made or initialised is left out. What a module throws ends its listing, and the
/// classes listed so far stay; a hardware fault in it is not contained. Where something failed although
/// classes were listed, the outcome's reason says what.
class VST3Probe : public IPluginProbe {
public:
    std::optional<ProbeOutcome> look(const ProbeJob &job) const override;

private:
    ProbeOutcome ask(const ProbeJob &job, IProbeObserver &observer) override;
};
