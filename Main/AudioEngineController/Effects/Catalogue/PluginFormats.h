#pragma once

#include <QString>

#include <vector>

struct CatalogueFormat;

/// The formats that a plug-in identifier can name. The numbers are part of the workstation's files.
enum class PluginFormat {
    Unknown = 0,
    BuiltIn = 1,
    Vst2 = 2,
    AudioUnit = 3,
    Vst3 = 4,
    Clap = 5,
    Last = Clap, ///< the greatest number
};

namespace PluginPrefix {
inline constexpr char kBuiltIn[] = "mrl:";
inline constexpr char kVst2[] = "vst2:";
inline constexpr char kAudioUnit[] = "au:";
inline constexpr char kVst3[] = "vst3:";
inline constexpr char kClap[] = "clap:";
inline constexpr char kPlaceholder[] = "placeholder:"; ///< stands for a plug-in that is missing
} // namespace PluginPrefix

/// What a format is called, what its modules look like on disk, and how its catalogue is kept.
struct PluginFormatInfo {
    PluginFormat format;
    const char *key;      ///< in reports, markers' channel and JSON; never changes
    const char *title;    ///< for people
    const char *prefix;   ///< of its identifiers in memory, with the ":"
    QString moduleEnding; ///< of its modules' names, with the dot; empty: there is nothing to scan for
    const CatalogueFormat *catalogue; ///< the file, and its markers; null: it keeps none
    /// The name, in lower case, of the folders in which the format has its modules lie; null: it has no rule.
    const char *folderName = nullptr;
    const char *folderVariables = ""; ///< names, between blanks, of environment variables that name folders
    /// Whether a folder of the modules' ending is a module as well: all that it holds is part of it.
    bool hasBundles = false;

    bool isScanned() const { return !moduleEnding.isEmpty(); }
};

/// All formats, in the order in which they are scanned.
const std::vector<PluginFormatInfo> &pluginFormats();
/// A format's row; the format must be one of the table.
const PluginFormatInfo &formatInfo(PluginFormat format);
/// The format of that key; null for a key that the table does not have.
const PluginFormatInfo *formatOfKey(const QString &key);

/// The folder that holds everything in a bundle, appended to the bundle's path.
inline constexpr char kBundleContents[] = "/Contents";
/// The path of the innermost bundle that holds a file; empty when the file is not in a bundle.
QString bundleOf(const QString &path);
/// Whether a file lies in a folder that has the ending of bundles, whole ones or not.
bool isBelowBundle(const QString &path);
/// Whether a path is that of a plain module in such a folder: a part of what the folder stands for.
bool isPartOfBundle(const QString &path);

/// The format that a prefix names; the prefix is compared whole and case-sensitively.
PluginFormat formatOfPrefix(const QString &prefix);
/// The identifier's part up to and with its first ":"; empty when it has none.
QString prefixOf(const QString &identifier);
/// The name that a user sees for the format of an identifier prefix; "Unknown" for a placeholder and for a
/// prefix that is not ours.
QString formatName(const QString &prefix);
