#pragma once

#include "Core/BaseLib/Process/KriticalSection.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTSpeakers.h"
#include "Main/AudioEngineController/Effects/VST/VSTDescription.h"

#include <atomic>

/// Tells a plug-in in use the speakers behind its channels, and remembers what it was told.
class VSTSpeakerLink {
public:
    /// Numbers of channels.
    struct Counts {
        VstInt32 inputs;
        VstInt32 outputs;

        bool operator!=(const Counts &other) const
        {
            return inputs != other.inputs || outputs != other.outputs;
        }
    };

    /// Both belong to the plug-in's object, which outlives this one.
    VSTSpeakerLink(VSTEffect &effect, const VSTNaming &naming)
        : m_effect(effect)
        , m_naming(naming)
    {}

    /// The effect is another one, or its channels changed. Any thread.
    void setPending() { m_pending = true; }
    /// Whether the plug-in does not know its speakers, or has other channels than it stated last.
    bool isDue() const;
    /// Tells it the speakers of the bus formats of so many channels, as far as they suit those that it
    /// states. Calls it under the processing lock. True when it accepted.
    bool tell(Counts requested, KriticalSection &processingLock);
    /// Whether it accepted the last time.
    bool wasAccepted() const { return m_accepted; }

private:
    Counts statedCounts() const;
    /// The numbers of channels to tell the speakers of; nothing when the plug-in cannot be told any.
    std::optional<Counts> countsToTell(Counts requested, Counts stated) const;
    bool tellSpeakers(Counts counts);
    std::optional<bool> offer(VSTArrangementPair speakers);

    VSTEffect &m_effect;
    const VSTNaming &m_naming;
    std::atomic<bool> m_pending{true};
    std::optional<Counts> m_toldCounts; ///< what the plug-in stated when it was last told
    bool m_accepted = false;
};
