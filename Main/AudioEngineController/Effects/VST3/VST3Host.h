#pragma once

#include "Main/AudioEngineController/Effects/Host/AudioPluginHost.h"

/// The host of VST 3 plug-ins.
class VST3Host : public AudioPluginHost {
public:
    VST3Host();

    bool Scan(bool scan, bool inProcess) override;
    QString moduleEnding() const override { return QStringLiteral(".vst3"); }
    LoadedPlugin loadPlugin(const QString &identifier) override;

protected:
    bool isMarkerWithoutRecord(const EffectRecord &marker) const override;
};
