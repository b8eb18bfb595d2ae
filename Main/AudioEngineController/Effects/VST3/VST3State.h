#pragma once

#include <QByteArray>
#include <QString>

#include <pluginterfaces/base/ibstream.h>
#include <pluginterfaces/base/smartpointer.h>

#include <public.sdk/source/common/memorystream.h>

#include <limits>
#include <optional>

/// The two halves of an instance's state, as the plug-in wrote them.
struct VST3State {
    QByteArray component;
    QByteArray controller; ///< empty where there is none
};

/// Both as one block (little-endian): format 1, and each half after its size in 32 bits.
QByteArray writeVST3State(const VST3State &state);
/// The same back; nothing, with the reason, when the bytes are not exactly such a block.
std::optional<VST3State> readVST3State(const QByteArray &data, QString &reason);

/// A stream to read a copy of the bytes from.
Steinberg::IPtr<Steinberg::IBStream> streamOf(const QByteArray &bytes);
/// What was written to a stream; null when it is more than a block holds.
QByteArray bytesOf(const Steinberg::MemoryStream &stream);

/// The state of a component or a controller; null when it gives none.
template <typename Object>
QByteArray stateOf(Object &object)
{
    const auto stream = Steinberg::owned(new Steinberg::MemoryStream);
    return object.getState(stream) == Steinberg::kResultOk ? bytesOf(*stream) : QByteArray();
}

template <typename Object>
Steinberg::tresult setStateOf(Object &object, const QByteArray &bytes)
{
    const Steinberg::IPtr<Steinberg::IBStream> stream = streamOf(bytes);
    return object.setState(stream);
}
