#pragma once

#include <QString>

/// The formats that a plug-in identifier can name. The numbers are part of the workstation's files.
enum class PluginFormat {
    Unknown = 0,
    BuiltIn = 1,
    Vst2 = 2,
    AudioUnit = 3,
    Vst3 = 4,
};

namespace PluginPrefix {
inline constexpr char kBuiltIn[] = "mrl:";
inline constexpr char kVst2[] = "vst2:";
inline constexpr char kAudioUnit[] = "au:";
inline constexpr char kVst3[] = "vst3:";
inline constexpr char kPlaceholder[] = "placeholder:"; ///< stands for a plug-in that is missing
} // namespace PluginPrefix

/// The format that a prefix names; the prefix is compared whole and case-sensitively.
PluginFormat formatOfPrefix(const QString &prefix);
/// The identifier's part up to and with its first ":"; empty when it has none.
QString prefixOf(const QString &identifier);
/// The name that a user sees for the format of an identifier prefix; "Unknown" for a placeholder and for no
/// prefix of ours.
QString formatName(const QString &prefix);
