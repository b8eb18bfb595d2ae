#pragma once

#include <QtGlobal>

struct clap_plugin;

/// The channels of an initialised plug-in's main audio ports, of all ports where none is main. None for a
/// plug-in without the extension, which has no ports.
struct CLAPChannels {
    qint32 inputs = 0;
    qint32 outputs = 0;
};

/// Exceptions of the plug-in leave this.
CLAPChannels channelsOf(const clap_plugin &plugin);
