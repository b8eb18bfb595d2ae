#pragma once

#include "Main/AudioEngineController/Effects/Host/CatalogueHost.h"

/// The host of VST 3 plug-ins.
class VST3Host : public CatalogueHost {
public:
    VST3Host();

    LoadedPlugin loadPlugin(const QString &identifier) override;

    bool isModule(const QString &path) const override;
    QString moduleTime(const QString &path) const override;
    QString moduleLibrary(const QString &path) const override;
    QString moduleFolder(const QString &path) const override;
    QString displayName(const QString &path) const override;
    bool probesInPathOrder() const override { return false; }
    bool announcesEachRecord() const override { return false; }
    std::unique_ptr<IPluginProbe> makeProbe() const override;
    bool isMarkerWithoutRecord(const EffectRecord &marker) const override;
};
