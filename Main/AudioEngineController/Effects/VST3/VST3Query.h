#pragma once

#include <QString>

#include <pluginterfaces/base/ipluginbase.h>
#include <pluginterfaces/base/smartpointer.h>

#include <cstring>

/// Text of a fixed-size field, which need not be terminated; invalid UTF-8 is replaced.
template <std::size_t Size>
QString fixedText(const Steinberg::char8 (&field)[Size])
{
    return QString::fromUtf8(field, static_cast<int>(strnlen(field, Size)));
}

/// The vendor that a factory states; empty when it states none.
inline QString vendorOf(Steinberg::IPluginFactory &factory)
{
    Steinberg::PFactoryInfo info;
    std::memset(static_cast<void *>(&info), 0, sizeof info);
    factory.getFactoryInfo(&info);
    return fixedText(info.vendor);
}

/// Asks for an interface; null when the object lacks it, whatever it answered.
template <typename Interface>
Steinberg::IPtr<Interface> queryFor(Steinberg::FUnknown *object)
{
    void *found = nullptr;
    if (object->queryInterface(Interface::iid, &found) != Steinberg::kResultOk)
        return nullptr;
    return Steinberg::owned(static_cast<Interface *>(found));
}

/// Has a factory make an object of a class, with one reference for the caller; null when it gives none, with
/// its answer in `result`.
template <typename Interface>
Interface *createObject(Steinberg::IPluginFactory *factory, const Steinberg::FUID &classId,
                        Steinberg::tresult &result)
{
    void *made = nullptr;
    result = factory->createInstance(classId.toTUID(), Interface::iid, &made);
    return result == Steinberg::kResultOk ? static_cast<Interface *>(made) : nullptr;
}
