#pragma once

#include "Main/AudioEngineController/Effects/Protocol/Probe.h"

/// Asks VST 2 modules. A shell is entered once for itself and once for each of its sub-plug-ins.
class VSTProbe : public IPluginProbe {
public:
    std::optional<ProbeOutcome> look(const ProbeJob &job) const override;

private:
    ProbeOutcome ask(const ProbeJob &job, IProbeObserver &observer) override;
};
