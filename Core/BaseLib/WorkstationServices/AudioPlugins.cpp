#include "Core/BaseLib/WorkstationServices/AudioPlugins.h"

#include "Core/BaseLib/Log/Assertion.h"

#include <atomic>

namespace {
std::atomic<PluginHost *> s_registry{nullptr};
}

void AudioPlugins::setRegistry(PluginHost *registry) { s_registry = registry; }

PluginHost *AudioPlugins::registry()
{
    PluginHost *_this = s_registry;
    if (!_this)
        reportAssertion("0 != _this", SourcePlace{"Core/BaseLib/AudioPlugins", 24});
    return _this;
}
