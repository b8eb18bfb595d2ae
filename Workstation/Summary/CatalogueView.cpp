#include "Workstation/Summary/CatalogueView.h"

#include "Core/BaseLib/Files/AnswerInTime.h"
#include "Core/BaseLib/Files/SearchArea.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/CategoryTable.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Main/AudioEngineController/Effects/Protocol/FolderRules.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <algorithm>
#include <array>
#include <set>
#include <tuple>

namespace {

/// What a VST 2 plug-in's own category number says: VstPlugCategory of the VST 2.4 interface, from 0.
constexpr std::array<const char *, 12> kVst2Categories = {
    "",     "Effect",   "Synth",       "Analysis",        "Mastering", "Spatial",
    "Room", "Surround", "Restoration", "Offline Process", "Shell",     "Generator"};

QStringList namesOfSet(quint32 category)
{
    QStringList names;
    for (const Category &each : CategoryTable::categories())
        if (category & CategoryTable::instance().internalBit(each.index))
            names.append(QString::fromLatin1(each.name));
    return names;
}

/// The first element of a record that is not well-formed XML as it is written.
QString badElement(const CatalogueFormat &format, const EffectRecord &record)
{
    const auto textOf = [&record](const CatalogueElement &element) {
        const QByteArray content = element.content(record).value_or(QByteArray());
        return content.startsWith(kLineEnd) ? record.subName.toUtf8() : content; // a block holds elements
    };
    for (const CatalogueElement &element : format.elements)
        for (const char bad : {'<', '&'})
            if (element.content && textOf(element).contains(bad))
                return QStringLiteral("the %1 of '%2' (%3) holds \"%4\"")
                    .arg(QString::fromLatin1(element.name).toLower(), record.name, record.path,
                         QString(QLatin1Char(bad)));
    return QString();
}

/// Whether a file is not there because its folder is not, or is empty, or because what it is a link to is
/// not.
bool isAway(const QString &path)
{
    if (!fileAnswers(path))
        return true;
    const QFileInfo file(path);
    return !file.exists() && (!file.dir().exists() || file.dir().isEmpty() || leadsNowhere(path) ||
                              leadsNowhere(bundleOf(path)));
}

/// Whether a file is not there although its folder is.
bool isGone(const QString &path) { return !QFileInfo::exists(path) && !cannotBeExamined(path); }

void readCatalogue(const PluginFormatInfo &format, const QString &effectsFolder, const FolderRules &rules,
                   CatalogueView &view)
{
    const QString path = effectsFolder + QLatin1String(format.catalogue->fileName);
    if (!QFile::exists(path))
        return;
    const CatalogueContents contents = readCatalogueFile(*format.catalogue, path);
    if (!contents)
        view.problems.append(QStringLiteral("%1 cannot be read as a whole, and the next scan probes the rest "
                                            "anew: %2")
                                 .arg(path, contents.reason));
    std::set<QString> crashed;
    std::set<QString> described; // by records of what is in the file
    for (const EffectRecord &record : contents.records) {
        if (record.isCrashedFile())
            crashed.insert(record.path);
        if (!record.standsForFile())
            described.insert(record.path);
    }
    const auto isOfCrashedFile = [&crashed](const EffectRecord &record) {
        return crashed.count(record.path) != 0 && !record.isCrashedFile();
    };
    for (const EffectRecord &record : contents.records) {
        if (record.standsForFile() && described.count(record.path) != 0)
            continue; // its plug-ins are shown, each with the reason that the file has
        view.plugins.push_back({&format, record, QString(), isOfCrashedFile(record), isAway(record.path)});
        CataloguedPlugin &plugin = view.plugins.back();
        plugin.isGone = !plugin.isAway && isGone(record.path);
        plugin.isIgnored = record.isIgnored() || (!plugin.isAway && rules.isIgnored(record.path));
        if (record.isIgnored())
            plugin.record.fileTime.clear(); // is no time
        if (plugin.state() == PluginState::Disabled) {
            const QString now = PluginHost::instance().host(format.format).moduleTime(record.path);
            plugin.hasChanged = !now.isEmpty() && now != record.fileTime;
        }
        if (const QString bad = badElement(*format.catalogue, record); !bad.isEmpty())
            view.problems.append(QStringLiteral("%1 is not well-formed XML: %2").arg(path, bad));
    }
}

} // namespace

const char *stateText(PluginState state)
{
    switch (state) {
    case PluginState::Ok:
        return "ok";
    case PluginState::Failed:
        return "failed";
    case PluginState::Disabled:
        return "disabled";
    case PluginState::SwitchedOff:
        return "switched off";
    case PluginState::NoPlugin:
        return "no plug-in";
    case PluginState::Skipped:
        return "skipped";
    case PluginState::Ignored:
        return "ignored";
    case PluginState::FolderAway:
        return "folder away";
    case PluginState::FileGone:
        return "file gone";
    case PluginState::NotAsked:
        return "not asked";
    }
    return "";
}

PluginState CataloguedPlugin::state() const
{
    if (isIgnored)
        return PluginState::Ignored;
    if (isAway)
        return PluginState::FolderAway;
    if (isGone)
        return PluginState::FileGone;
    if (isOfCrashedFile)
        return PluginState::Disabled;
    if (record.isSwitchedOff())
        return PluginState::SwitchedOff;
    if (record.working)
        return PluginState::Ok;
    if (isUnasked)
        return PluginState::NotAsked;
    return record.enabled ? PluginState::Failed : PluginState::Disabled;
}

QStringList CataloguedPlugin::categories() const
{
    if (const QStringList names = namesOfSet(record.category); !names.isEmpty())
        return names;
    if (!record.categories.isEmpty())
        return record.categories.split(QLatin1Char('|'), Qt::SkipEmptyParts);
    const auto number = static_cast<std::size_t>(record.vstCategory);
    const bool isNamed = record.vstCategory > 0 && number < kVst2Categories.size();
    return isNamed ? QStringList(QString::fromLatin1(kVst2Categories[number])) : QStringList();
}

CatalogueView readCatalogues(const QString &effectsFolder)
{
    CatalogueView view;
    const FolderRules rules = readFolderRules(effectsFolder);
    if (!rules)
        view.problems.append(QStringLiteral("%1%2 cannot be used: %3")
                                 .arg(effectsFolder, QLatin1String(kFolderRulesFile), rules.reason));
    for (const PluginFormatInfo &format : pluginFormats())
        if (format.isScanned())
            readCatalogue(format, effectsFolder, rules, view);
    const auto sortKey = [](const CataloguedPlugin &plugin) {
        return std::make_tuple(plugin.record.name.toCaseFolded(), plugin.record.path, plugin.record.id);
    };
    std::stable_sort(
        view.plugins.begin(), view.plugins.end(),
        [&](const CataloguedPlugin &a, const CataloguedPlugin &b) { return sortKey(a) < sortKey(b); });
    return view;
}

CatalogueView onlyBelow(CatalogueView view, const QStringList &paths)
{
    const SearchArea area(paths, {});
    const auto isOutside = [&](const CataloguedPlugin &plugin) {
        const QString &path = plugin.record.path; // by which the file was known before, through another link
        return !area.isWithin(path) && (plugin.isAway || !area.isWithin(realPath(path).value_or(path)));
    };
    if (area.isLimited())
        view.plugins.erase(std::remove_if(view.plugins.begin(), view.plugins.end(), isOutside),
                           view.plugins.end());
    return view;
}
