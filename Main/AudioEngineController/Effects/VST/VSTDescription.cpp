#include "Main/AudioEngineController/Effects/VST/VSTDescription.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Plugin/PluginBehaviour.h"

#include <set>

namespace {

constexpr int kNameSize = 1024;
constexpr int kVendorSize = 256;
constexpr int kMaxKey = 255; ///< UTF-16 units

/// Plug-in text is widened character by character, as unsigned bytes.
QString widen(const QByteArray &text) { return QString::fromLatin1(text); }

/// The fields as they stand now: each call may change them. Zeroed when the memory cannot be read.
VSTEffect::Fields fieldsOf(const VSTEffect &effect) { return effect.fields().value_or(VSTEffect::Fields{}); }

/// An instrument is named after its file, unless it is one of a shell's.
bool asksForName(VSTEffect &effect, VstInt32 shellId)
{
    if (fieldsOf(effect).numInputs == 0)
        return shellId != 0;
    const VstIntPtr category = effect.dispatch(effGetPlugCategory);
    return category != kPlugCategSynth || shellId != 0;
}

VstInt32 categoryOf(VSTEffect &effect, int behaviour)
{
    if (fieldsOf(effect).numInputs == 0 || PluginBehaviour::isInstrument(behaviour))
        return kPlugCategSynth;
    return static_cast<VstInt32>(effect.dispatch(effGetPlugCategory));
}

} // namespace

QString vstNameOfFile(const QString &path)
{
    const int slash = path.lastIndexOf(QLatin1Char('/'));
    return slash < 0 ? QString() : path.mid(slash + 1).section(QLatin1Char('.'), 0, 0);
}

VSTNaming nameEffect(VSTEffect &effect, const QString &path, VstInt32 shellId)
{
    VSTNaming naming;
    naming.name = vstNameOfFile(path);
    if (asksForName(effect, shellId)) {
        const VSTEffect::Text text = effect.dispatchText(effGetEffectName, kNameSize);
        if (text.answer != 0 || !text.bytes.isEmpty())
            naming.name = widen(text.bytes);
    }
    const auto uniqueId = static_cast<long>(fieldsOf(effect).uniqueID);
    naming.key = cutText(formatText(L"%ls:%ld", naming.name, uniqueId), kMaxKey);
    naming.behaviour = PluginBehaviour::lookUp(QStringLiteral("vst"), naming.key);
    return naming;
}

void describeEffect(VSTEffect &effect, EffectRecord &record)
{
    const VSTNaming naming = nameEffect(effect, record.path, static_cast<VstInt32>(record.subId));
    record.vstCategory = categoryOf(effect, naming.behaviour);
    record.behaviour = naming.behaviour;
    record.vendor = widen(effect.dispatchText(effGetVendorString, kVendorSize).bytes);
    const VSTEffect::Fields fields = fieldsOf(effect);
    record.inputs = fields.numInputs;
    record.outputs = record.width = fields.numOutputs;
    record.latency = fields.initialDelay;
    record.name = naming.name;
    record.id = naming.key;
}

std::vector<VSTSubPlugin> subPluginsOf(VSTEffect &shell, const QString &name)
{
    std::vector<VSTSubPlugin> found;
    std::set<quint32> ids;
    for (std::size_t repeated = 0; repeated < kMaxSubPlugins;) {
        const VSTEffect::Text next = shell.dispatchText(effShellGetNextPlugin, kNameSize);
        const auto id = static_cast<quint32>(next.answer);
        if (id == 0)
            return found;
        if (ids.count(id) != 0) {
            ++repeated; // some go round and round
            continue;
        }
        if (found.size() == kMaxSubPlugins)
            break;
        ids.insert(id);
        found.push_back({id, widen(next.bytes)});
    }
    DebugLog(L"The shell %ls names more than %d sub-plug-ins; the rest is left out", name,
             static_cast<int>(kMaxSubPlugins));
    return found;
}
