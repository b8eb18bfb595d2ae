#pragma once

#include "Main/AudioEngineController/Effects/Host/FolderScan.h"

/// One scan for VST 3 modules.
class VST3FolderScan : public FolderScan {
public:
    explicit VST3FolderScan(AudioPluginHost &host);

protected:
    std::vector<ScanItem> arrange(const QStringList &paths) override;
    bool process(const ScanItem &item) override;
    void complete() override;

private:
    void decide(const QString &path, std::vector<ScanItem> &queue);
    void keepLater(const KnownList::Records &records);
    bool addRecords(const ScanItem &item, std::vector<EffectRecord> &records);
    bool addFailedRecord(const ScanItem &item, EffectRecord record);

    KnownList::Records m_keptByName; ///< records of other files, added when those files had their turn
};
