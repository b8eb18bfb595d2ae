#include "Main/AudioEngineController/Effects/VST/VSTParameterList.h"

#include "Core/BaseLib/Log/FormatText.h"

#include <QtEndian>

#include <cstring>

namespace {

constexpr quint32 kFormat = 2;
constexpr int kHeaderSize = 8;
constexpr int kNameSize = 64;
constexpr int kEntrySize = kNameSize + 4;

void append(QByteArray &data, quint32 number)
{
    char bytes[sizeof number];
    qToLittleEndian(number, bytes);
    data.append(bytes, sizeof bytes);
}

quint32 numberAt(const QByteArray &data, int offset)
{
    return qFromLittleEndian<quint32>(data.constData() + offset);
}

} // namespace

QByteArray storedName(const QString &name) { return name.toLatin1().left(kNameSize - 1); }

QByteArray writeParameterList(const std::vector<VSTStoredParameter> &parameters)
{
    QByteArray data;
    data.reserve(kHeaderSize + kEntrySize * static_cast<int>(parameters.size()));
    append(data, kFormat);
    append(data, static_cast<quint32>(parameters.size()));
    for (const VSTStoredParameter &parameter : parameters) {
        data.append(parameter.name.left(kNameSize - 1).leftJustified(kNameSize, '\0'));
        quint32 bits = 0;
        std::memcpy(&bits, &parameter.value, sizeof bits);
        append(data, bits);
    }
    return data;
}

std::optional<std::vector<VSTStoredParameter>> readParameterList(const QByteArray &data, QString &reason)
{
    if (data.size() < kHeaderSize || numberAt(data, 0) != kFormat) {
        reason = QStringLiteral("it is not a parameter list");
        return std::nullopt;
    }
    const quint32 count = numberAt(data, 4);
    if (static_cast<quint64>(data.size()) != kHeaderSize + quint64(kEntrySize) * count) {
        reason = formatText(L"it has %d bytes for %u parameters", data.size(), count);
        return std::nullopt;
    }
    std::vector<VSTStoredParameter> parameters;
    for (int offset = kHeaderSize; offset < data.size(); offset += kEntrySize) {
        const QByteArray field = data.mid(offset, kNameSize);
        const int length = field.indexOf('\0');
        if (length < 0) {
            reason =
                formatText(L"the name of parameter %d does not end", static_cast<int>(parameters.size()));
            return std::nullopt;
        }
        const quint32 bits = numberAt(data, offset + kNameSize);
        VSTStoredParameter parameter{field.left(length), 0.0f};
        std::memcpy(&parameter.value, &bits, sizeof bits);
        parameters.push_back(parameter);
    }
    return parameters;
}
