#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostMessage.h"

#include <cstring>
#include <exception>
#include <new>

using namespace Steinberg;

namespace {

std::unique_ptr<char[]> copyOf(FIDString text) noexcept
{
    if (text == nullptr)
        return nullptr;
    const std::size_t size = std::strlen(text) + 1;
    std::unique_ptr<char[]> copy(new (std::nothrow) char[size]);
    if (copy)
        std::memcpy(copy.get(), text, size);
    return copy;
}

} // namespace

FIDString PLUGIN_API VST3HostMessage::getMessageID() { return m_messageId.get(); }

// Copied before the old text is freed: the new one may be the old one, or a part of it.
void PLUGIN_API VST3HostMessage::setMessageID(FIDString id) { m_messageId = copyOf(id); }

Vst::IAttributeList *PLUGIN_API VST3HostMessage::getAttributes()
{
    try {
        if (!m_attributes)
            m_attributes = VST3HostAttributeList::createOwned();
    } catch (const std::exception &) {
        return nullptr;
    }
    return m_attributes.get();
}
