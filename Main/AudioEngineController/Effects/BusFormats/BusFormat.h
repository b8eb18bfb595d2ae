#pragma once

#include <string>
#include <vector>

/// A layout of channels that a bus of the studio may have, whatever the plug-in format on it.
struct BusFormat {
    int code;                        ///< the studio's number of it
    const char *name;                ///< as the user knows it
    bool mayBeDiscrete;              ///< may be handed to a plug-in as that many channels without a layout
    std::vector<std::string> labels; ///< short label of each channel, in the studio's channel order

    int channels() const { return static_cast<int>(labels.size()); }
};

/// Added to a number of channels, this makes the code of that many channels without a layout.
inline constexpr int kDiscreteChannels = 0x100;

/// All bus formats. Of several with the same number of channels the one that such a bus most often has comes
/// first. Any thread.
const std::vector<BusFormat> &busFormats();
/// The format of a code; null when there is none.
const BusFormat *findBusFormat(int code);
/// The formats of that many channels, in the order of the table.
std::vector<const BusFormat *> busFormatsOfChannels(int channels);
