#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostContext.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/Interface/IVSTEffectOwner.h"

#include <algorithm>
#include <cstdio>

VSTHostContext &VSTHostContext::instance()
{
    static VSTHostContext context;
    return context;
}

void VSTHostContext::setAudioSettings(int sampleRate, int blockSize)
{
    m_sampleRate = sampleRate;
    m_blockSize = blockSize;
}

const VSTSpeakerArrangement *VSTHostContext::findArrangement(int channels) const
{
    const auto found = m_arrangements.find(channels);
    if (found == m_arrangements.end())
        return nullptr;
    const VSTSpeakerArrangement &arrangement = found->second;
    std::printf("Found arrangement for:%d chs:%d type:%d\n", channels, arrangement.numChannels,
                arrangement.type);
    for (int index = 0; index < arrangement.numChannels; ++index)
        std::printf("Speaker: %d%s\n", index, arrangement.speakers[index].name);
    return &arrangement;
}

std::vector<VSTHostContext::Registered>::iterator VSTHostContext::registered(const IVSTEffectOwner *owner)
{
    return std::find_if(m_owners.begin(), m_owners.end(),
                        [owner](const Registered &entry) { return entry.owner == owner; });
}

void VSTHostContext::registerOwner(IVSTEffectOwner *owner)
{
    const std::lock_guard<std::mutex> lock(m_ownersMutex);
    m_owners.push_back({owner, 0});
}

void VSTHostContext::unregisterOwner(IVSTEffectOwner *owner)
{
    stopIgnoring(owner); // another owner may get this address
    std::unique_lock<std::mutex> lock(m_ownersMutex);
    m_unpinned.wait(lock, [&] { return registered(owner)->pins == 0; });
    m_owners.erase(registered(owner));
}

bool VSTHostContext::pin(const IVSTEffectOwner *claimed)
{
    const std::lock_guard<std::mutex> lock(m_ownersMutex);
    const auto entry = registered(claimed);
    if (entry == m_owners.end())
        return false;
    ++entry->pins;
    return true;
}

void VSTHostContext::unpin(const IVSTEffectOwner *owner)
{
    const std::lock_guard<std::mutex> lock(m_ownersMutex);
    if (--registered(owner)->pins == 0)
        m_unpinned.notify_all();
}

void VSTHostContext::logLoadedPlugins() const
{
    const std::lock_guard<std::mutex> lock(m_ownersMutex);
    DebugLog(L"VSTs ");
    for (const Registered &entry : m_owners)
        DebugLog(L"vst: %s: ", entry.owner->name());
}
