#pragma once

#include "Core/BaseLib/Process/FaultGuard.h"

#include <QString>

#include <pluginterfaces/base/ipluginbase.h>

#include <algorithm>
#include <cstring>
#include <exception>
#include <iterator>

// How a plug-in's interfaces are asked.

/// The exception being handled, in words.
inline QString thrownText()
{
    try {
        throw;
    } catch (const std::exception &error) {
        return QLatin1String("it threw: ") + QString::fromUtf8(error.what());
    } catch (...) {
        return QStringLiteral("it threw something other than a standard exception");
    }
}

/// Makes a call into a plug-in. What it throws, in words; empty when it threw nothing.
template <typename Call>
QString thrownBy(Call &&call)
{
    try {
        callTranslated(call);
    } catch (...) {
        return thrownText();
    }
    return QString();
}

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
/// its answer in `result`.
template <typename Interface>
Interface *createObject(Steinberg::IPluginFactory *factory, const Steinberg::FUID &classId,
                        Steinberg::tresult &result)
{
    void *made = nullptr;
    result = factory->createInstance(classId.toTUID(), Interface::iid, &made);
    return result == Steinberg::kResultOk ? static_cast<Interface *>(made) : nullptr;
}
