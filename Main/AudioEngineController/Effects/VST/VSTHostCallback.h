#pragma once

#include "Main/AudioEngineController/Effects/VST/VSTInterface.h"

/// Bookkeeping of the host callback's calls that are active on this thread.
namespace VSTCallbackNesting {

/// Most active calls on one thread that are answered.
inline constexpr std::int32_t kMaxActive = 10;
/// From here on the counter is taken to have run away, and is set back instead of refusing calls for ever.
inline constexpr std::int32_t kRunaway = 4096;

/// The number of active calls on this thread.
std::int32_t active();
void setActive(std::int32_t count);

/// Puts the counter back at the end of a scope: a fault leaves the calls that it passes without their
/// farewell.
class Restore {
public:
    Restore()
        : m_before(active())
    {}
    ~Restore() { setActive(m_before); }
    Restore(const Restore &) = delete;
    Restore &operator=(const Restore &) = delete;

private:
    std::int32_t m_before;
};

} // namespace VSTCallbackNesting

/// The one function through which every VST 2 plug-in talks to the host (the `audioMasterCallback` of the
/// interface). Any thread. Answers from the settings of `VSTHost::instance()`; checks pointers of the
/// plug-in for null and uses them only for what the opcode says, and takes no lock that a scan holds while it
/// calls a plug-in.
VstIntPtr VSTHostCallback(AEffect *effect, VstInt32 opcode, VstInt32 index, VstIntPtr value, void *ptr,
                          float opt);
