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

/// An instrument is named after its file, unless it is one of a shell's.
bool asksForName(VSTEffect &effect, const VSTEffect::Fields &fields, VstInt32 shellId)
{
    if (fields.numInputs == 0)
        return shellId != 0;
    const VstIntPtr category = effect.dispatch(effGetPlugCategory);
    return category != kPlugCategSynth || shellId != 0;
}

VstInt32 categoryOf(VSTEffect &effect, const VSTEffect::Fields &fields, int behaviour)
{
    if (fields.numInputs == 0 || PluginBehaviour::isInstrument(behaviour))
        return kPlugCategSynth;
    return static_cast<VstInt32>(effect.dispatch(effGetPlugCategory));
}

} // namespace

QString vstNameOfFile(const QString &path)
{
    const int slash = path.lastIndexOf(QLatin1Char('/'));
    return slash < 0 ? QString() : path.mid(slash + 1).section(QLatin1Char('.'), 0, 0);
}

VSTNaming nameEffect(VSTEffect &effect, const VSTEffect::Fields &fields, const QString &path,
                     VstInt32 shellId)
{
    VSTNaming naming;
    naming.name = vstNameOfFile(path);
    if (asksForName(effect, fields, shellId)) {
        const VSTEffect::Text text = effect.dispatchText(effGetEffectName, kNameSize);
        if (text.answer != 0 || !text.bytes.isEmpty())
            naming.name = widen(text.bytes);
    }
    naming.key = cutText(formatText(L"%ls:%ld", naming.name, static_cast<long>(fields.uniqueID)), kMaxKey);
    naming.behaviour = PluginBehaviour::lookUp(QStringLiteral("vst"), naming.key);
    return naming;
}

void describeEffect(VSTEffect &effect, EffectRecord &record)
{
    const VSTEffect::Fields fields = effect.fields().value_or(VSTEffect::Fields{});
    const VSTNaming naming = nameEffect(effect, fields, record.path, static_cast<VstInt32>(record.subId));
    record.vstCategory = categoryOf(effect, fields, naming.behaviour);
    const VSTEffect::Fields later = effect.fields().value_or(fields); // the calls may have changed them
    record.behaviour = naming.behaviour;
    record.vendor = widen(effect.dispatchText(effGetVendorString, kVendorSize).bytes);
    record.width = later.numOutputs;
    record.latency = later.initialDelay;
    record.name = naming.name;
    record.id = naming.key;
}

std::vector<VSTSubPlugin> subPluginsOf(VSTEffect &shell, const QString &name)
{
    std::vector<VSTSubPlugin> found;
    std::set<quint32> ids;
    for (int count = 0; count < kMaxSubPlugins; ++count) {
        const VSTEffect::Text next = shell.dispatchText(effShellGetNextPlugin, kNameSize);
        const auto id = static_cast<quint32>(next.answer);
        if (id == 0)
            return found;
        if (ids.insert(id).second)
            found.push_back({id, widen(next.bytes)});
    }
    DebugLog(L"The shell %ls names more than %d sub-plug-ins; the rest is left out", name, kMaxSubPlugins);
    return found;
}
