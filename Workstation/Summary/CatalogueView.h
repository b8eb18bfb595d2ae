#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"

#include <QString>
#include <QStringList>

#include <optional>
#include <vector>

/// Whether a plug-in of the catalogue can be used.
enum class PluginState {
    Ok,
    Failed,      ///< it does not work
    Disabled,    ///< it ended the scanner; it is not loaded any more
    SwitchedOff, ///< by the user
    NoPlugin,    ///< a file named like a plug-in that is none
    Skipped,     ///< by the user, in the last scan, and nothing is known of it
    Ignored,     ///< never loaded, because the user wants it so
    FolderAway,  ///< the folder that it lay in is not there, or is empty: on a drive that is unplugged
    FileGone,    ///< its folder is there, and its file is not
    NotAsked,    ///< the next scan asks it: it is not ignored any more
};

/// For people and for JSON.
const char *stateText(PluginState state);

/// One record of a catalogue.
struct CataloguedPlugin {
    const PluginFormatInfo *format;
    EffectRecord record;

    QString reason; ///< why it cannot be used: one phrase, without a full stop; empty when it can
    bool isOfCrashedFile = false; ///< another record says that the whole file ended the scanner: it is not
                                  ///< loaded any more

    bool isAway = false; ///< see `PluginState::FolderAway`

    PluginState state() const;
    qint32 inputs = -1;      ///< audio channels as far as catalogue and last probe tell; -1: unknown
    qint32 outputs = -1;     ///< the same
    bool isIgnored = false;  ///< see `PluginState::Ignored`
    bool isGone = false;     ///< see `PluginState::FileGone`
    bool isUnasked = false;  ///< see `PluginState::NotAsked`
    bool hasChanged = false; ///< its file is another one than that for which it was disabled
    /// What its last probe came to; only where somebody wants to see it.
    std::optional<RememberedProbe> probe{};
    bool isUsable() const { return isUsableIfThere() && !isGone; }
    /// The same as long as its file is there.
    bool isUsableIfThere() const { return record.working && !isOfCrashedFile && !isAway && !isIgnored; }
    /// The categories' names, else what the plug-in says of itself.
    QStringList categories() const;
};

/// What the catalogue files of an Effects folder hold, read without changing anything: markers stay where
/// they are.
struct CatalogueView {
    std::vector<CataloguedPlugin> plugins; ///< by name, then path
    QStringList problems;                  ///< one sentence each: files that no XML reader takes, and why
};

CatalogueView readCatalogues(const QString &effectsFolder);

/// Takes out the plug-ins that lie neither at nor below some paths; none: all stay.
CatalogueView onlyBelow(CatalogueView view, const QStringList &paths);
