#pragma once

#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostAttributeList.h"

#include <pluginterfaces/vst/ivstmessage.h>

#include <memory>

/// A message that a plug-in's two halves send each other through the host. Scan worker thread; only the
/// reference count is safe anywhere. Nothing throws.
class VST3HostMessage final : public VST3HostObject<VST3HostMessage, Steinberg::Vst::IMessage> {
public:
    explicit VST3HostMessage(VST3Holder holder) noexcept
        : VST3HostObject(holder)
    {}

    /// Null while none is set. The text stays the message's; it holds until the next `setMessageID`.
    Steinberg::FIDString PLUGIN_API getMessageID() override;
    /// Keeps a copy; null takes the identifier away, as does want of memory.
    void PLUGIN_API setMessageID(Steinberg::FIDString id) override;
    /// The message's one list, made at the first call, with no reference added: it goes with the message
    /// unless the caller adds a reference. Null without memory.
    Steinberg::Vst::IAttributeList *PLUGIN_API getAttributes() override;

private:
    friend VST3HostObject;

    ~VST3HostMessage() = default;

    std::unique_ptr<char[]> m_messageId;
    VST3Owned<VST3HostAttributeList> m_attributes;
};
