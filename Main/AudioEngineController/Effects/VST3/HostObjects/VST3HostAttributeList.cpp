#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostAttributeList.h"

#include <algorithm>
#include <exception>
#include <string_view>
#include <utility>

using namespace Steinberg;
using Vst::TChar;

// The value is made before the old one goes: a plug-in may store a block that it got from this very key.
template <typename Make>
tresult VST3HostAttributeList::store(AttrID id, Make makeValue) noexcept
{
    if (id == nullptr)
        return kInvalidArgument;
    try {
        Value value = makeValue();
        m_values.insert_or_assign(std::string(id), std::move(value));
        return kResultOk;
    } catch (const std::exception &) {
        return kOutOfMemory;
    }
}

template <typename Type>
const Type *VST3HostAttributeList::find(AttrID id) const noexcept
{
    if (id == nullptr)
        return nullptr;
    const auto place = m_values.find(std::string_view(id));
    return place == m_values.end() ? nullptr : std::get_if<Type>(&place->second);
}

tresult PLUGIN_API VST3HostAttributeList::setInt(AttrID id, int64 value)
{
    return store(id, [value] { return Value(value); });
}

tresult PLUGIN_API VST3HostAttributeList::setFloat(AttrID id, double value)
{
    return store(id, [value] { return Value(value); });
}

// The terminator is stored with the text, so that it reaches a reader with room for it.
tresult PLUGIN_API VST3HostAttributeList::setString(AttrID id, const TChar *text)
{
    if (text == nullptr)
        return kInvalidArgument;
    return store(id, [text] { return Value(Text(text, Text::traits_type::length(text) + 1)); });
}

tresult PLUGIN_API VST3HostAttributeList::setBinary(AttrID id, const void *data, uint32 size)
{
    if (data == nullptr && size > 0)
        return kInvalidArgument;
    const auto *bytes = static_cast<const uint8 *>(data);
    return store(id, [bytes, size] { return Value(size > 0 ? Block(bytes, bytes + size) : Block()); });
}

tresult PLUGIN_API VST3HostAttributeList::getInt(AttrID id, int64 &value)
{
    const int64 *stored = find<int64>(id);
    if (stored == nullptr)
        return kResultFalse;
    value = *stored;
    return kResultOk;
}

tresult PLUGIN_API VST3HostAttributeList::getFloat(AttrID id, double &value)
{
    const double *stored = find<double>(id);
    if (stored == nullptr)
        return kResultFalse;
    value = *stored;
    return kResultOk;
}

// NOTE: the size counts UTF-16 units here, although the interface speaks of bytes; callers were written for
// hosts of both readings, and with units none of them gets less text than there is.
tresult PLUGIN_API VST3HostAttributeList::getString(AttrID id, TChar *text, uint32 size)
{
    const Text *stored = find<Text>(id);
    if (stored == nullptr)
        return kResultFalse;
    if (text == nullptr)
        return kInvalidArgument;
    std::copy_n(stored->data(), std::min<std::size_t>(size, stored->size()), text);
    return kResultOk;
}

tresult PLUGIN_API VST3HostAttributeList::getBinary(AttrID id, const void *&data, uint32 &size)
{
    const Block *stored = find<Block>(id);
    if (stored == nullptr)
        return kResultFalse;
    data = stored->data();
    size = static_cast<uint32>(stored->size());
    return kResultOk;
}
