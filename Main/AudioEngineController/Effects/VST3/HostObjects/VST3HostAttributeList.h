#pragma once

#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostObject.h"

#include <pluginterfaces/vst/ivstattributes.h>

#include <functional>
#include <map>
#include <string>
#include <variant>
#include <vector>

/// Named values that a plug-in keeps with the host. Scan worker thread; only the reference count is safe
/// anywhere.
///
/// Nothing throws: a null key or source gives `kInvalidArgument`, want of memory `kOutOfMemory`, and both
/// leave the list as it was.
class VST3HostAttributeList final
    : public VST3HostObject<VST3HostAttributeList, Steinberg::Vst::IAttributeList> {
public:
    explicit VST3HostAttributeList(VST3Holder holder) noexcept
        : VST3HostObject(holder)
    {}

    /// The setters replace what the key held, of whatever type.
    Steinberg::tresult PLUGIN_API setInt(AttrID id, Steinberg::int64 value) override;
    Steinberg::tresult PLUGIN_API setFloat(AttrID id, double value) override;
    Steinberg::tresult PLUGIN_API setString(AttrID id, const Steinberg::Vst::TChar *text) override;
    /// `size` in bytes; the block is copied.
    Steinberg::tresult PLUGIN_API setBinary(AttrID id, const void *data, Steinberg::uint32 size) override;

    /// The getters answer `kResultFalse`, and leave the caller's variables alone, where the key holds no
    /// value of the type asked for.
    Steinberg::tresult PLUGIN_API getInt(AttrID id, Steinberg::int64 &value) override;
    Steinberg::tresult PLUGIN_API getFloat(AttrID id, double &value) override;
    /// Copies at most `size` UTF-16 units; the text is cut, and then without a terminator, where it is
    /// longer.
    Steinberg::tresult PLUGIN_API getString(AttrID id, Steinberg::Vst::TChar *text,
                                            Steinberg::uint32 size) override;
    /// The block stays the list's; it holds until the key is set again. `size` in bytes.
    Steinberg::tresult PLUGIN_API getBinary(AttrID id, const void *&data, Steinberg::uint32 &size) override;

private:
    friend VST3HostObject;
    using Text = std::basic_string<Steinberg::Vst::TChar>;
    using Block = std::vector<Steinberg::uint8>;
    using Value = std::variant<Steinberg::int64, double, Text, Block>;

    ~VST3HostAttributeList() = default;

    template <typename Make>
    Steinberg::tresult store(AttrID id, Make makeValue) noexcept;
    /// Null where the key is missing or holds another type.
    template <typename Type>
    const Type *find(AttrID id) const noexcept;

    /// Ordered by the bytes of the key.
    std::map<std::string, Value, std::less<>> m_values;
};
