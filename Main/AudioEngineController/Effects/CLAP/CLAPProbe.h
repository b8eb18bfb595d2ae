#pragma once

#include "Main/AudioEngineController/Effects/Protocol/Probe.h"

/// Lists the plug-ins of CLAP modules.
///
/// A plug-in that cannot be made or initialised is left out. What a module throws ends its listing, and what
/// was listed so far stays; a hardware fault in it is not contained. Where something failed although plug-ins
/// were listed, the outcome's reason says what.
class CLAPProbe : public IPluginProbe {
public:
    std::optional<ProbeOutcome> look(const ProbeJob &job) const override;

private:
    ProbeOutcome ask(const ProbeJob &job, IProbeObserver &observer) override;
};
