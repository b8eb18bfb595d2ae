#pragma once

#include "Core/BaseLib/Files/NativeFile.h"

#include <QString>

/// The time stamp of a record that is ignored.
inline constexpr char kIgnoredTime[] = "ignored";

/// One plug-in as the catalogue knows it. A value type; lists copy it.
struct EffectRecord {
    QString path;           ///< full path of the plug-in file, "/" as separator
    QString fileTime;       ///< the file's last-modified local time, "yyyy-MM-dd hh:mm"
    QString name;           ///< display name
    QString id;             ///< plug-in identifier without the prefix of its format; empty: it has none
    QString vendor;         ///< as the plug-in reports it
    QString version;        ///< the same; not in every format
    QString categories;     ///< what the plug-in says of its kind, between bars; not in every format
    qint32 inputs = -1;     ///< audio input channels; -1: unknown
    qint32 outputs = -1;    ///< audio output channels; -1: unknown
    bool enabled = true;    ///< false: switched off by the user, or it crashed the scanner
    quint32 category = 0;   ///< category set in its internal form, see `CategoryTable`
    bool working = true;    ///< false: loading or probing it failed or crashed
    bool favourite = false; ///< the user's mark
    qint32 vstCategory = 0; ///< VST 2: the plug-in's own category number
    qint32 behaviour = 0;   ///< VST 2: handle of `PluginBehaviour`; no file carries it
    qint32 width = 0;       ///< VST 2: channel width
    qint32 latency = 0;     ///< VST 2: samples
    QString subName;        ///< VST 2: name of a shell's sub-plug-in
    quint32 subId = 0;      ///< VST 2: identifier of a shell's sub-plug-in; 0: it is not one
    bool hasFreeId =
        false; ///< plug-ins choose any text as identifier, also a file's name; set when it is read

    /// True for what the user wants never loaded: disabled and not working, and in place of the file's time
    /// stands a word that no file has.
    bool isIgnored() const { return !enabled && !working && fileTime == QLatin1String(kIgnoredTime); }
    /// True for what a crash marker made of a whole file: disabled and not working.
    bool isCrashedFile() const { return !enabled && !working && subId == 0 && !isIgnored(); }
    /// True for what stands for a whole file that crashed or failed: such a record is identified by the
    /// file's name or path.
    bool standsForFile() const;
    /// True when the user switched the plug-in off: what crashed is not working as well.
    bool isSwitchedOff() const { return !enabled && working; }
    /// True when it holds something that the user set: a favourite, a category, a switch-off.
    bool hasMarks() const { return favourite || category != 0 || isSwitchedOff(); }
    /// True when both records stand for the same file, or the same sub-plug-in of one.
    bool isSamePlugin(const EffectRecord &other) const
    {
        return subId == other.subId && isSamePath(path, other.path);
    }
};

/// True when all fields are the same.
bool operator==(const EffectRecord &left, const EffectRecord &right);

/// The last component of a path.
QString fileNameOf(const QString &path);

/// Takes over the marks that the user set on an old record of the same plug-in: favourite, category, and the
/// switch-off. A plug-in that is switched off stays so, and is not shown as failed, also when it fails to
/// load.
void takeMarks(EffectRecord &record, const EffectRecord &old);

/// Makes a record fit whether the user wants its file never loaded; true when it changed. A record that was
/// usable, or failed, becomes ignored, and back again one that failed and has to be asked anew. The user's
/// switch-off and a crash stay as they are: neither is loaded, and both are to be known afterwards.
bool settleIgnored(EffectRecord &record, bool isIgnored);

/// Gives the record a name made from its path: the file name up to its last ".", with the first "x64", then
/// the first
/// "_64", then the first " 64bit" taken out. False, and no change, for a path without a ".".
bool NameFromPath(EffectRecord &record);
