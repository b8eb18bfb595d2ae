#pragma once

#include <pluginterfaces/vst/vstspeaker.h>

#include <QtGlobal>

#include <map>
#include <string>

/// From the studio's channel position to the plug-in's channel index, both counted from 0.
using VST3ChannelMap = std::map<int, int>;

/// What is set for a single plug-in.
struct VST3PluginSettings {
    qint32 maxChannels = 0; ///< the most channels that it is offered in one direction; 0: no limit
};

/// The speakers of a bus format, or of a number of discrete channels (`kDiscreteChannels` added), and where
/// its channels go. The map is set to that of a named format, extended by that of discrete channels, and left
/// alone by a code that is not in the table, which gives stereo. A format wider than the plug-in's limit is
/// replaced by a limited one where there is one, with a log line; the map stays that of the format. Any
/// thread.
Steinberg::Vst::SpeakerArrangement arrangementFor(int formatCode, VST3ChannelMap &channelMap,
                                                  const VST3PluginSettings &pluginSettings);

/// What a plug-in of few channels is offered in place of a bus format; 0 when there is nothing. It may have
/// more speakers than `maxChannels`.
Steinberg::Vst::SpeakerArrangement limitedArrangement(int formatCode, int maxChannels);

/// The speaker of a channel label of the bus formats; 0 for any other label.
Steinberg::Vst::Speaker vst3Speaker(const std::string &label);
