#pragma once

#include "Core/BaseLib/Log/FormatText.h"
#include "Core/BaseLib/Process/FaultGuard.h"

#include <QString>

#include <pluginterfaces/base/ipluginbase.h>

#include <algorithm>
#include <cstring>
#include <iterator>

// How a plug-in's interfaces are asked.

/// Text of a fixed-size field, which need not be terminated; invalid UTF-8 is replaced.
template <std::size_t Size>
QString fixedText(const Steinberg::char8 (&field)[Size])
{
    return QString::fromUtf8(field, static_cast<int>(strnlen(field, Size)));
}

/// The same of UTF-16; half a surrogate pair is replaced.
template <std::size_t Size>
QString fixedText(const Steinberg::char16 (&field)[Size])
{
    const auto length = std::find(std::begin(field), std::end(field), Steinberg::char16(0)) - field;
    const QString text(reinterpret_cast<const QChar *>(field), static_cast<int>(length));
    return QString::fromUtf8(text.toUtf8());
}

/// The vendor that a factory states; empty when it states none.
inline QString vendorOf(Steinberg::IPluginFactory &factory)
{
    Steinberg::PFactoryInfo info;
    std::memset(static_cast<void *>(&info), 0, sizeof info);
    factory.getFactoryInfo(&info);
    return fixedText(info.vendor);
}

/// Has a factory make an object of a class, with one reference for the caller; null when it gives none, with
/// the reason: "could not be created".
template <typename Interface>
Interface *createObject(Steinberg::IPluginFactory *factory, const Steinberg::FUID &classId, QString &reason)
{
    void *made = nullptr;
    const Steinberg::tresult result = factory->createInstance(classId.toTUID(), Interface::iid, &made);
    if (result == Steinberg::kResultOk && made)
        return static_cast<Interface *>(made);
    reason = formatText(L"could not be created (result 0x%08X)", result);
    return nullptr;
}

/// Initialises an object; false when it refuses, with the reason: "could not be initialised". Such an object
/// is not called again: it is neither terminated nor released.
inline bool initialise(Steinberg::IPluginBase &object, Steinberg::FUnknown *context, QString &reason)
{
    const Steinberg::tresult result = object.initialize(context);
    if (result != Steinberg::kResultOk)
        reason = formatText(L"could not be initialised (result 0x%08X)", result);
    return result == Steinberg::kResultOk;
}
