#pragma once

#include <QByteArray>
#include <QString>

#include <array>

/// The state of a plug-in as a project keeps it. A value type, of no format in particular.
struct PluginPreset {
    /// Bits of `flags`.
    static constexpr quint32 kBypassed = 1;
    static constexpr quint32 kRealtime = 2;
    static constexpr quint32 kOwnLatency = 4; ///< the upper 16 bits hold a latency in samples

    QByteArray data;                              ///< what the plug-in gave, or the list of its parameters
    qint32 isChunk = 0;                           ///< 1: the data is the plug-in's own; 0: a parameter list
    QByteArray name;                              ///< the plug-in's, in Latin-1
    QString identifier;                           ///< the plug-in's, with the prefix of its format
    std::array<qint32, 2> firstChannels = {0, 0}; ///< the first channel in use: input, output
    std::array<qint32, 2> channelSpans = {0, 0};  ///< how many are in use from there: inputs, outputs
    quint32 flags = 0;                            ///< settings of the plug-in object, see above
};
