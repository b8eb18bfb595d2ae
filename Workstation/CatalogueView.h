#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"

#include <QString>
#include <QStringList>

#include <vector>

/// One plug-in format as fxscan deals with it.
struct PluginFormat {
    const char *key;   ///< as in reports and in JSON
    const char *title; ///< for people
    QString ending;    ///< of the files' names, with its dot
    const CatalogueFormat &catalogue;
};

/// VST 3 and VST 2, in the order in which they are scanned.
const std::vector<PluginFormat> &pluginFormats();
/// The format of that key; VST 2 for a key that nobody knows.
const PluginFormat &pluginFormat(const QString &key);

/// Whether a plug-in of the catalogue can be used.
enum class PluginState {
    Ok,
    Failed,      ///< it does not work
    Disabled,    ///< it ended the scanner; it is not loaded any more
    SwitchedOff, ///< by the user
};

/// For people and for JSON.
const char *stateText(PluginState state);

/// One record of a catalogue.
struct CataloguedPlugin {
    const PluginFormat *format;
    EffectRecord record;

    bool isOfCrashedFile = false; ///< another record says that the whole file ended the scanner: it is not
                                  ///< loaded any more

    PluginState state() const;
    bool isUsable() const { return record.working && !isOfCrashedFile; }
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
