#pragma once

#include <pluginterfaces/base/funknown.h>

#include <atomic>
#include <cstdint>
#include <cstring>
#include <memory>
#include <new>
#include <tuple>
#include <utility>

/// Whose the first reference of a new host object is.
enum class VST3Holder { plugin, owner };

/// The reference count of an object that plug-ins can reach. Any thread.
///
/// Plug-ins release what they hold no reference to: their smart pointers take over what was handed out
/// without one. So the references of plug-ins and the one of an owner in our own code are told apart, in one
/// atomic word; a plug-in can only give back what plug-ins have taken.
class VST3ReferenceCount {
public:
    /// What a dropped reference left behind.
    struct Rest {
        Steinberg::uint32 count; ///< references of both kinds that are left
        bool last;               ///< this was the last one: the caller deletes the object
    };

    explicit VST3ReferenceCount(VST3Holder first) noexcept
        : m_held(first == VST3Holder::owner ? kOwner : 1)
    {}

    /// Adds a plug-in's reference; returns how many there are now.
    Steinberg::uint32 add() noexcept { return total(m_held.fetch_add(1) + 1); }

    /// Takes a plug-in's reference away; without one there is nothing to take and nothing happens.
    Rest drop() noexcept
    {
        std::uint64_t held = m_held.load();
        do {
            if (held % kOwner == 0)
                return {total(held), false};
        } while (!m_held.compare_exchange_weak(held, held - 1));
        return {total(held - 1), held == 1};
    }

    /// Takes the owner's reference away. Once only, and only where the first reference was an owner's.
    Rest dropOwner() noexcept
    {
        const std::uint64_t held = m_held.fetch_sub(kOwner) - kOwner;
        return {total(held), held == 0};
    }

private:
    /// The owner's reference in the word; the bits below count the plug-ins', more than any can take.
    static constexpr std::uint64_t kOwner = std::uint64_t(1) << 48;

    static Steinberg::uint32 total(std::uint64_t held) noexcept
    {
        return static_cast<Steinberg::uint32>(held % kOwner + held / kOwner);
    }

    std::atomic<std::uint64_t> m_held;
};

/// Gives the owner's reference back: the object goes, or stays until the plug-ins that hold it release it.
struct VST3OwnerRelease {
    template <typename Object>
    void operator()(Object *object) const noexcept
    {
        object->letGo();
    }
};

/// A host object held by its owner. However often a plug-in releases it, it lives as long as this does.
template <typename Object>
using VST3Owned = std::unique_ptr<Object, VST3OwnerRelease>;

/// Whether a plug-in's identifier (null: no; at any alignment) is that of a known interface.
inline bool isInterface(const Steinberg::int8 *iid, const Steinberg::FUID &known) noexcept
{
    return iid != nullptr && std::memcmp(iid, known.toTUID(), sizeof(Steinberg::TUID)) == 0;
}

/// What the objects that we hand to plug-ins have in common: reference counting and the search for an
/// interface. `Object` is the final class; the interface tables stand in the order given.
template <typename Object, typename... Interfaces>
class VST3HostObject : public Interfaces... {
public:
    /// A new object with one reference, which goes to a plug-in; null without memory.
    static Object *createCounted() noexcept { return new (std::nothrow) Object(VST3Holder::plugin); }

    /// A new object that belongs to the caller. Throws std::bad_alloc.
    template <typename... Arguments>
    static VST3Owned<Object> createOwned(Arguments &&...arguments)
    {
        return VST3Owned<Object>(new Object(VST3Holder::owner, std::forward<Arguments>(arguments)...));
    }

    /// The interface asked for, with a reference added; null and `kNotImplemented` for any other.
    Steinberg::tresult PLUGIN_API queryInterface(const Steinberg::TUID interfaceId, void **obj) override
    {
        if (obj == nullptr)
            return Steinberg::kInvalidArgument;
        *obj = find(interfaceId);
        if (*obj == nullptr)
            return Steinberg::kNotImplemented;
        addRef();
        return Steinberg::kResultOk;
    }

    Steinberg::uint32 PLUGIN_API addRef() override { return m_references.add(); }
    /// Never deletes an object that its owner still holds.
    Steinberg::uint32 PLUGIN_API release() override { return settle(m_references.drop()); }
    /// Gives the owner's reference back; `VST3Owned` calls it.
    void letGo() noexcept { settle(m_references.dropOwner()); }

    /// The object under the interface that names it, which several tables would leave ambiguous.
    Steinberg::FUnknown *unknown() noexcept { return static_cast<First *>(this); }

protected:
    explicit VST3HostObject(VST3Holder holder) noexcept
        : m_references(holder)
    {}
    ~VST3HostObject() = default;
    VST3HostObject(const VST3HostObject &) = delete;
    VST3HostObject &operator=(const VST3HostObject &) = delete;

private:
    using First = std::tuple_element_t<0, std::tuple<Interfaces...>>;

    void *find(const Steinberg::int8 *interfaceId) noexcept
    {
        void *found = isInterface(interfaceId, Steinberg::FUnknown::iid) ? unknown() : nullptr;
        ((isInterface(interfaceId, Interfaces::iid) ? void(found = static_cast<Interfaces *>(this)) : void()),
         ...);
        return found;
    }

    Steinberg::uint32 settle(VST3ReferenceCount::Rest rest) noexcept
    {
        if (rest.last)
            delete static_cast<Object *>(this);
        return rest.count;
    }

    VST3ReferenceCount m_references;
};
