#pragma once

#include "Main/AudioEngineController/Effects/Host/FolderScan.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"

#include <vector>

/// One scan for VST 2 plug-ins.
class VSTFolderScan : public FolderScan {
public:
    explicit VSTFolderScan(VSTHost &host);

protected:
    std::vector<ScanItem> arrange(const QStringList &paths) override;
    bool process(const ScanItem &item) override;

private:
    class Observer;

    bool probe(const ScanItem &item);
    bool addListed(const ScanItem &item, const EffectRecord &record);
    bool addProbed(const ScanItem &item, EffectRecord record);
    bool addFailed(const ScanItem &item, EffectRecord record);
};
