#pragma once

#include <QByteArray>
#include <QString>

#include <optional>
#include <vector>

/// One parameter in the preset of a plug-in that keeps no state of its own.
struct VSTStoredParameter {
    QByteArray name; ///< Latin-1, at most 63 bytes
    float value;     ///< as the plug-in reports it, which may be any number
};

/// The state of such a plug-in as bytes (little-endian): format 2, the count, and for each parameter 64 bytes
/// of its name, zero-terminated, and its value.
QByteArray writeParameterList(const std::vector<VSTStoredParameter> &parameters);
/// The same back; nothing, with the reason, when the bytes are not exactly such a list.
std::optional<std::vector<VSTStoredParameter>> readParameterList(const QByteArray &data, QString &reason);
/// As much of a parameter's name as a list keeps.
QByteArray storedName(const QString &name);
