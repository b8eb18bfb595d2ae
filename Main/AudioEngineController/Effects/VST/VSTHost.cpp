#include "Main/AudioEngineController/Effects/VST/VSTHost.h"

#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostCallback.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostContext.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"
#include "Main/AudioEngineController/Effects/VST/VSTProbe.h"

#include <QRegularExpression>

namespace {

constexpr char kOldNameMark[] = " [2.4]"; ///< names of earlier catalogues end so
constexpr char kOldKeyMark[] = "Waves ";

} // namespace

double waveShellVersion(const QString &fileName)
{
    static const QRegularExpression pattern(
        QStringLiteral("\\AWaveShell[+-]?\\d+-VST\\s*([+-]?\\d+(?:\\.\\d*)?)_x64%1\\z")
            .arg(QRegularExpression::escape(PluginLibrary::fileEnding())));
    const QRegularExpressionMatch match = pattern.match(fileName);
    return match.hasMatch() ? parseDecimal(match.captured(1)) : 0.0;
}

VSTHost::VSTHost()
    : CatalogueHost(PluginFormat::Vst2)
{}

bool VSTHost::Scan(bool scan, bool)
{
    const bool written = CatalogueHost::Scan(scan, true);
    return scan ? written : cleanUpNames();
}

bool VSTHost::cleanUpNames()
{
    const QLatin1String mark(kOldNameMark);
    std::vector<EffectRecord> records = effects();
    bool changed = false;
    for (EffectRecord &record : records) {
        const int at = record.name.indexOf(mark);
        if (at < 0)
            continue;
        record.name.truncate(at);
        changed = true;
    }
    if (!changed)
        return false;
    clearEffects();
    for (const EffectRecord &record : records)
        AddEffect(record);
    WriteCatalogue();
    return true;
}

bool VSTHost::AddEffect(const EffectRecord &record)
{
    const TAutoLockCS lock(&m_ks);
    const EffectRecord *stored = effectList().find(record.id);
    if (!stored || !record.path.contains(QLatin1String("WaveShell")))
        return CatalogueHost::AddEffect(record);
    if (waveShellVersion(fileNameOf(record.path)) <= waveShellVersion(fileNameOf(stored->path)))
        return false;
    EffectRecord later = record;
    if (later.category == 0 && !later.favourite && later.enabled)
        takeMarks(later, *stored);
    effectList().remove(record.id);
    return CatalogueHost::AddEffect(later);
}

std::optional<EffectRecord> VSTHost::findByKey(QString key) const
{
    std::optional<EffectRecord> record = findEffect(key);
    while (!record && key.contains(QLatin1String(kOldKeyMark))) {
        DebugLog(L"Found an old Waves plug-in, retrying as:");
        key.remove(0, static_cast<int>(sizeof kOldKeyMark - 1)); // wherever the mark is
        record = findEffect(key);
    }
    return record;
}

std::unique_ptr<VSTPlugin> VSTHost::loadByKey(const QString &key)
{
    const std::optional<EffectRecord> record = findByKey(key);
    return record ? loadRecord(*record, key) : nullptr;
}

LoadedPlugin VSTHost::loadPlugin(const QString &identifier)
{
    const std::optional<EffectRecord> record = findByKey(identifier);
    return {record.has_value(), record ? loadRecord(*record, identifier) : nullptr};
}

std::unique_ptr<VSTPlugin> VSTHost::loadRecord(const EffectRecord &record, const QString &requestedKey)
{
    DebugLog(L"Found: %ls, trying to load", record.id);
    const bool isOffline = record.vstCategory == kPlugCategOfflineProcess;
    if (isOffline || !record.enabled) {
        DebugLog(isOffline ? L"%ls processes whole files and is not loaded"
                           : L"%ls is switched off and not loaded",
                 record.id);
        return nullptr;
    }
    auto plugin = std::make_unique<VSTPlugin>();
    if (plugin->load(record, VSTHostCallback, 0)) {
        if (requestedKey != record.id)
            plugin->setRequestedKey(requestedKey);
        return plugin;
    }
    DebugLog(L"%ls, Didn't manage it", record.id);
    return nullptr;
}

void VSTHost::setAudioSettings(int sampleRate, int blockSize)
{
    VSTHostContext::instance().setAudioSettings(sampleRate, blockSize);
}

std::unique_ptr<IPluginProbe> VSTHost::makeProbe() const { return std::make_unique<VSTProbe>(); }
