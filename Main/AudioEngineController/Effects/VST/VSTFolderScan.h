#pragma once

#include "Main/AudioEngineController/Effects/Host/FolderScan.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"

#include <memory>
#include <vector>

class ProbeBracket;

/// One scan for VST 2 plug-ins.
class VSTFolderScan : public FolderScan {
public:
    explicit VSTFolderScan(VSTHost &host);

protected:
    std::vector<ScanItem> arrange(const QStringList &paths) override;
    bool process(const ScanItem &item) override;

private:
    bool probe(const ScanItem &item);
    bool addProbed(const ScanItem &item, EffectRecord record);
    bool addFailed(const ScanItem &item, EffectRecord record);
    bool expandShell(const ScanItem &item, VSTPlugin &plugin, const std::vector<EffectRecord> &children,
                     const ProbeBracket &bracket);
    std::shared_ptr<ProbeBracket> bracketOfChild(const std::vector<EffectRecord> &children, VstInt32 shellId);
    bool addChild(const ScanItem &item, VSTPlugin &plugin, const EffectRecord &child);

    VSTHost &m_vstHost;
};
