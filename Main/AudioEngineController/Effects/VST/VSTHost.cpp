#include "Main/AudioEngineController/Effects/VST/VSTHost.h"

#include "Core/BaseLib/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/VSTCatalogue.h"
#include "Main/AudioEngineController/Effects/VST/VSTFolderScan.h"
#include "Main/AudioEngineController/Effects/VST/VSTHostCallback.h"
#include "Main/AudioEngineController/Effects/VST/VSTModuleFile.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"

#include <QRegularExpression>

#include <algorithm>

namespace {

std::atomic<VSTHost *> s_instance{nullptr};

constexpr char kOldNameMark[] = " [2.4]"; ///< names of earlier catalogues end so
constexpr char kOldKeyMark[] = "Waves ";

} // namespace

double waveShellVersion(const QString &fileName)
{
    static const QRegularExpression pattern(
        QStringLiteral("\\AWaveShell[+-]?\\d+-VST\\s*([+-]?\\d+(?:\\.\\d*)?)_x64%1\\z")
            .arg(QRegularExpression::escape(VSTModuleFile::ending())));
    const QRegularExpressionMatch match = pattern.match(fileName);
    return match.hasMatch() ? parseDecimal(match.captured(1)) : 0.0;
}

VSTHost::VSTHost()
    : AudioPluginHost(&vstCatalogueFormat())
{
    VSTHost *none = nullptr;
    s_instance.compare_exchange_strong(none, this);
}

VSTHost::~VSTHost()
{
    VSTHost *self = this;
    s_instance.compare_exchange_strong(self, nullptr);
}

VSTHost &VSTHost::instance()
{
    if (VSTHost *existing = s_instance)
        return *existing;
    static VSTHost own;
    return own;
}

bool VSTHost::Scan(bool scan, bool)
{
    if (scan)
        return VSTFolderScan(*this).run();
    refillEffects();
    return cleanUpNames();
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
        return AudioPluginHost::AddEffect(record);
    if (waveShellVersion(fileNameOf(record.path)) <= waveShellVersion(fileNameOf(stored->path)))
        return false;
    EffectRecord later = record;
    if (later.category == 0 && !later.favourite && later.enabled)
        takeMarks(later, *stored);
    effectList().remove(record.id);
    return AudioPluginHost::AddEffect(later);
}

std::unique_ptr<VSTPlugin> VSTHost::loadByKey(const QString &key)
{
    const std::optional<EffectRecord> record = findEffect(key);
    if (!record) {
        if (!key.contains(QLatin1String(kOldKeyMark)))
            return nullptr;
        DebugLog(L"Found an old Waves plug-in, retrying as:");
        return loadByKey(key.mid(static_cast<int>(sizeof kOldKeyMark - 1)));
    }
    DebugLog(L"Found: %ls, trying to load", key);
    if (record->vstCategory == kPlugCategOfflineProcess || !record->enabled)
        return nullptr;
    auto plugin = std::make_unique<VSTPlugin>(*this);
    if (plugin->load(*record, VSTHostCallback, 0))
        return plugin;
    DebugLog(L"%ls, Didn't manage it", key);
    return nullptr;
}

void VSTHost::setAudioSettings(int sampleRate, int blockSize)
{
    m_sampleRate = sampleRate;
    m_blockSize = blockSize;
}

bool VSTHost::shellIdOfPluginBeingLoaded(VstInt32 &id) const
{
    const VSTPlugin *plugin = m_pluginBeingLoaded;
    if (plugin)
        id = plugin->shellId();
    return plugin != nullptr;
}

bool VSTHost::isRegistered(const VSTPlugin *plugin) const
{
    return std::find(m_plugins.begin(), m_plugins.end(), plugin) != m_plugins.end();
}

void VSTHost::registerPlugin(VSTPlugin *plugin)
{
    const std::lock_guard<std::mutex> lock(m_pluginsMutex);
    m_plugins.push_back(plugin);
}

void VSTHost::unregisterPlugin(VSTPlugin *plugin)
{
    const std::lock_guard<std::mutex> lock(m_pluginsMutex);
    m_plugins.erase(std::remove(m_plugins.begin(), m_plugins.end(), plugin), m_plugins.end());
}

void VSTHost::logLoadedPlugins() const
{
    const std::lock_guard<std::mutex> lock(m_pluginsMutex);
    DebugLog(L"VSTs ");
    for (const VSTPlugin *plugin : m_plugins)
        DebugLog(L"vst: %s: ", plugin->name());
}
