#include "Main/AudioEngineController/Effects/VST3/VST3State.h"

#include <QtEndian>

using namespace Steinberg;

namespace {

constexpr quint32 kFormat = 1;
constexpr int kNumberSize = 4;
/// Two halves and their numbers stay below what a byte array holds.
constexpr TSize kMaxHalf = std::numeric_limits<int>::max() / 2 - 64;

void append(QByteArray &data, quint32 number)
{
    char bytes[kNumberSize];
    qToLittleEndian(number, bytes);
    data.append(bytes, sizeof bytes);
}

/// Takes a number off the front of what is left; nothing when that is too short.
std::optional<quint32> takeNumber(const QByteArray &data, int &offset)
{
    if (data.size() - offset < kNumberSize)
        return std::nullopt;
    offset += kNumberSize;
    return qFromLittleEndian<quint32>(data.constData() + offset - kNumberSize);
}

std::optional<QByteArray> takeHalf(const QByteArray &data, int &offset)
{
    const std::optional<quint32> size = takeNumber(data, offset);
    if (!size || *size > static_cast<quint32>(data.size() - offset))
        return std::nullopt;
    offset += static_cast<int>(*size);
    return data.mid(offset - static_cast<int>(*size), static_cast<int>(*size));
}

} // namespace

QByteArray writeVST3State(const VST3State &state)
{
    QByteArray data;
    append(data, kFormat);
    for (const QByteArray &half : {state.component, state.controller}) {
        append(data, static_cast<quint32>(half.size()));
        data.append(half);
    }
    return data;
}

std::optional<VST3State> readVST3State(const QByteArray &data, QString &reason)
{
    int offset = 0;
    if (takeNumber(data, offset) != kFormat) {
        reason = QStringLiteral("it is not the state of an instance");
        return std::nullopt;
    }
    const std::optional<QByteArray> component = takeHalf(data, offset);
    const std::optional<QByteArray> controller = component ? takeHalf(data, offset) : std::nullopt;
    if (!controller || offset != data.size()) {
        reason = QStringLiteral("its parts do not fill its %1 bytes").arg(data.size());
        return std::nullopt;
    }
    return VST3State{*component, *controller};
}

IPtr<IBStream> streamOf(const QByteArray &bytes)
{
    const auto stream = owned(new MemoryStream);
    int32 written = 0;
    QByteArray copy = bytes;
    if (!copy.isEmpty())
        stream->write(copy.data(), copy.size(), &written);
    stream->seek(0, IBStream::kIBSeekSet, nullptr);
    return IPtr<IBStream>(stream.get());
}

QByteArray bytesOf(const MemoryStream &stream)
{
    if (stream.getSize() > kMaxHalf)
        return QByteArray();
    return QByteArray(stream.getData() ? stream.getData() : "", static_cast<int>(stream.getSize()));
}
