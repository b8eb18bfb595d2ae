#pragma once

#include "Main/AudioEngineController/Effects/Host/AudioPluginHost.h"

/// The host of Audio Units, a format of one other system only: here it finds nothing and keeps no file.
class AudioUnitHost : public AudioPluginHost {
public:
    AudioUnitHost() = default;
};
