#include "Main/AudioEngineController/Effects/VST/Interface/VSTCallbackNesting.h"

#include "Core/BaseLib/Log/DebugLog.h"

namespace {
thread_local std::int32_t t_activeCalls = 0;
} // namespace

std::int32_t VSTCallbackNesting::active() { return t_activeCalls; }

void VSTCallbackNesting::setActive(std::int32_t count) { t_activeCalls = count; }

bool VSTCallbackNesting::enter()
{
    ++t_activeCalls;
    if (static_cast<std::uint32_t>(t_activeCalls) <= std::uint32_t(kMaxActive))
        return true;
    if (t_activeCalls >= kRunaway) {
        t_activeCalls = 0;
        return true;
    }
    DebugLog(L"VSTHost::HostCallback: Exceeded max Reentrancy: %d of %d", t_activeCalls, kMaxActive);
    return false;
}

void VSTCallbackNesting::leave() { --t_activeCalls; }
