#include "Workstation/Summary/PluginFilter.h"

#include <algorithm>

namespace {

const QLatin1String kVendor("vendor=");
const QLatin1String kCategory("category=");
const QLatin1String kInstrument("instrument");
const QLatin1String kFavourite("favourite");

/// A state as one word.
QString wordOf(PluginState state)
{
    return QString::fromLatin1(stateText(state)).replace(QLatin1Char(' '), QLatin1Char('-'));
}

/// The state that a probe leaves a plug-in in which the user did not switch off.
PluginState stateOf(ProbeStatus status)
{
    switch (status) {
    case ProbeStatus::Listed:
        return PluginState::Ok;
    case ProbeStatus::Failed:
        return PluginState::Failed;
    case ProbeStatus::Crashed:
    case ProbeStatus::NoAnswer:
        return PluginState::Disabled;
    case ProbeStatus::NoPlugin:
        return PluginState::NoPlugin;
    case ProbeStatus::Cancelled:
    case ProbeStatus::Skipped:
        return PluginState::Skipped;
    }
    return PluginState::Failed;
}

/// "category=Reverb", or "instrument": also what calls itself a synth, which catalogues without categories of
/// their own hold.
bool isOfCategory(const CataloguedPlugin &plugin, const QString &word)
{
    const QStringList names = word == kInstrument
                                  ? QStringList{QStringLiteral("Instrument"), QStringLiteral("Synth")}
                                  : QStringList(word.mid(kCategory.size()));
    const QStringList own = plugin.categories();
    return std::any_of(names.begin(), names.end(),
                       [&](const QString &name) { return own.contains(name, Qt::CaseInsensitive); });
}

} // namespace

PluginFilter::PluginFilter(const QStringList &words)
{
    for (const QString &word : words)
        m_words[kindOf(word)].append(word);
}

PluginFilter::Kind PluginFilter::kindOf(const QString &word)
{
    if (word.startsWith(kVendor))
        return Kind::Vendor;
    if (word.startsWith(kCategory) || word == kInstrument)
        return Kind::Category;
    if (word == kFavourite)
        return Kind::Mark;
    return formatOfKey(word) ? Kind::Format : Kind::State;
}

bool PluginFilter::fitsAll(const std::function<bool(Kind kind, const QString &word)> &isOne) const
{
    return std::all_of(m_words.begin(), m_words.end(), [&](const auto &entry) {
        return std::any_of(entry.second.begin(), entry.second.end(),
                           [&](const QString &word) { return isOne(entry.first, word); });
    });
}

bool PluginFilter::fits(const CataloguedPlugin &plugin) const
{
    return fitsAll([&](Kind kind, const QString &word) {
        switch (kind) {
        case Kind::State:
            return word == wordOf(plugin.state());
        case Kind::Format:
            return word == QLatin1String(plugin.format->key);
        case Kind::Mark:
            return plugin.record.favourite;
        case Kind::Category:
            return isOfCategory(plugin, word);
        case Kind::Vendor:
            return plugin.record.vendor.contains(word.mid(kVendor.size()), Qt::CaseInsensitive);
        }
        return false;
    });
}

/// Of a file without a record only format and state are known.
bool PluginFilter::fits(const PluginFormatInfo &format, PluginState state) const
{
    return fitsAll([&](Kind kind, const QString &word) {
        return (kind == Kind::State && word == wordOf(state)) ||
               (kind == Kind::Format && word == QLatin1String(format.key));
    });
}

bool PluginFilter::fits(PluginFormat format, ProbeStatus status) const
{
    return fits(formatInfo(format), stateOf(status));
}

void PluginFilter::apply(ScanSummary &summary) const
{
    if (m_words.empty())
        return;
    summary.all = countOf(summary);
    std::vector<CataloguedPlugin> shown;
    for (const CataloguedPlugin &plugin : summary.plugins)
        if (fits(plugin))
            shown.push_back(plugin);
    keepPlugins(summary, std::move(shown),
                [this](const PluginFailure &file) { return fits(*file.format, file.state); });
}
