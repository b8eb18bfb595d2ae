#include "Workstation/Forget.h"

#include "Core/BaseLib/Files/NativeFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <algorithm>

ForgetOutcome forgetFolder(const QString &effectsFolder, const QString &folder)
{
    ForgetOutcome outcome;
    const QString below = QDir::cleanPath(QFileInfo(folder).absoluteFilePath());
    for (const PluginFormatInfo &format : pluginFormats()) {
        const QString path =
            format.isScanned() ? effectsFolder + QLatin1String(format.catalogue->fileName) : QString();
        if (!QFile::exists(path))
            continue;
        std::vector<EffectRecord> records = readCatalogueFile(*format.catalogue, path).records;
        const auto kept = std::remove_if(records.begin(), records.end(), [&](const EffectRecord &record) {
            return isSamePath(record.path, below) || isBelow(record.path, below);
        });
        const auto dropped = static_cast<int>(records.end() - kept);
        records.erase(kept, records.end());
        const FileResult written =
            dropped == 0 ? FileResult()
                         : replaceFile(path, renderCatalogue(*format.catalogue, records), Durability::Synced);
        outcome.records += written ? dropped : 0;
        if (!written)
            outcome.written.reason = QStringLiteral("%1: %2").arg(path, written.reason);
    }
    return outcome;
}
