#pragma once

#include "Main/AudioEngineController/Effects/Host/CatalogueHost.h"

/// The host of CLAP plug-ins. They are listed, and not loaded for use yet.
class CLAPHost : public CatalogueHost {
public:
    CLAPHost();

    /// A placeholder that keeps the plug-in's place and state.
    LoadedPlugin loadPlugin(const QString &identifier) override;

    bool isModule(const QString &path) const override;
    bool announcesEachRecord() const override { return false; }
    std::unique_ptr<IPluginProbe> makeProbe() const override;
};
