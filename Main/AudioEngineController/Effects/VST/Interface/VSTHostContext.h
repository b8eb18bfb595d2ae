#pragma once

#include "Main/AudioEngineController/Effects/VST/Interface/VSTSpeakers.h"

#include <QScopeGuard>

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <vector>

class IVSTEffectOwner;

/// What the host callback answers from: the settings of the audio, and the owners of the effects. One for the
/// process, since plug-ins name no host in their calls. Any thread.
class VSTHostContext {
public:
    static VSTHostContext &instance();

    VSTHostContext(const VSTHostContext &) = delete;
    VSTHostContext &operator=(const VSTHostContext &) = delete;

    /// Sets the sample rate in Hz and the block size in samples.
    void setAudioSettings(int sampleRate, int blockSize);
    int sampleRate() const { return m_sampleRate; }
    int blockSize() const { return m_blockSize; }
    VstInt32 processLevel() const { return m_processLevel; }
    VstTimeInfo *timeInfo() const { return m_timeInfo; }

    /// The arrangement that is ready for exactly that many channels, also printed; null when there is none.
    const VSTSpeakerArrangement *findArrangement(int channels) const;
    /// The channels of the bus format of that many; 0 when there is none.
    int busFormatChannels(int channels) const { return m_arrangements.count(channels) != 0 ? channels : 0; }

    /// The owner for whom an entry point is being called, or null; a single slot, loads do not nest.
    IVSTEffectOwner *ownerBeingLoaded() const { return m_ownerBeingLoaded; }
    void setOwnerBeingLoaded(IVSTEffectOwner *owner) { m_ownerBeingLoaded = owner; }
    /// Notifications of this owner's plug-in are dropped; null: of none.
    void setIgnored(IVSTEffectOwner *owner) { m_ignored = owner; }
    /// Drops them no more, unless another owner took its place meanwhile.
    void stopIgnoring(IVSTEffectOwner *owner) { m_ignored.compare_exchange_strong(owner, nullptr); }
    bool isIgnored(const IVSTEffectOwner *owner) const { return owner == m_ignored; }

    void registerOwner(IVSTEffectOwner *owner);
    /// Waits until nobody works with the owner any more; so not to be called from inside such work.
    void unregisterOwner(IVSTEffectOwner *owner);
    /// Calls the operation with the owner that an effect names; false, without a call, for a null effect and
    /// for one that names nobody registered. The owner lives at least as long as the operation, which may
    /// call plug-in code but must not throw.
    template <typename Operation>
    bool withOwner(const AEffect *effect, Operation &&operation)
    {
        auto *owner = effect ? reinterpret_cast<IVSTEffectOwner *>(effect->resvd1) : nullptr;
        if (!owner || !pin(owner))
            return false;
        const auto pinned = qScopeGuard([&] { unpin(owner); }); // also when the thread is ended in it
        operation(*owner);
        return true;
    }
    /// Logs the names of all plug-ins.
    void logLoadedPlugins() const;

private:
    /// An owner, and how many calls work with it.
    struct Registered {
        IVSTEffectOwner *owner; ///< not owned
        int pins;
    };

    VSTHostContext() = default;

    std::vector<Registered>::iterator registered(const IVSTEffectOwner *owner);
    bool pin(const IVSTEffectOwner *claimed);
    void unpin(const IVSTEffectOwner *owner);

    std::atomic<int> m_blockSize{256};
    std::atomic<int> m_sampleRate{44100};
    std::atomic<IVSTEffectOwner *> m_ownerBeingLoaded{nullptr};
    std::atomic<IVSTEffectOwner *> m_ignored{nullptr};
    VstTimeInfo *m_timeInfo = nullptr; ///< not owned; the scanner has none
    VstInt32 m_processLevel = VstPublished::kVstProcessLevelUser;
    const VSTArrangementTable m_arrangements = vstArrangementTable();
    mutable std::mutex m_ownersMutex;
    std::condition_variable m_unpinned;
    std::vector<Registered> m_owners;
};
