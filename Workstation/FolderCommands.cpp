#include "Workstation/FolderCommands.h"

#include "Core/BaseLib/Files/AnswerInTime.h"
#include "Core/BaseLib/Files/SearchArea.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/Protocol/FolderRules.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"
#include "Workstation/Options/PluginFolders.h"
#include "Workstation/Options/ScanOptions.h"
#include "Workstation/Output/Terminal.h"
#include "Workstation/ScanFolders.h"

#include <QFile>
#include <QFileInfo>

#include <algorithm>
#include <functional>

namespace {

/// Carries out folder commands, and says what came of each. The first that cannot be done ends it.
class FolderEditor {
public:
    explicit FolderEditor(const QString &effectsFolder)
        : m_effectsFolder(effectsFolder)
        , m_rules(readFolderRules(effectsFolder))
        , m_list(ReadScanList(listPath()))
    {}

    int run(const ScanOptions &options);

private:
    using Records = std::vector<EffectRecord>;
    using Change = std::function<bool(Records &records)>; ///< of a catalogue; false: there was none

    QString listPath() const { return m_effectsFolder + QLatin1String(kScanListFile); }
    bool forget(const QString &given);
    bool exclude(const QString &given);
    bool ignore(const QString &given);
    bool takeBack(QStringList &rule, const QString &given, const char *state);
    int drop(const QStringList &paths);
    bool settleRules();
    void change(const Change &change);
    void writeRules();
    bool refuse(const QString &reason);
    void check(const QString &file, const FileResult &written);

    QString m_effectsFolder;
    FolderRules m_rules;
    ScanListContents m_list;
    int m_exitCode = ScanExit::kDone;
};

void say(const QString &text) { Terminal::print(Terminal::harmless(text) + QLatin1Char('\n')); }

QString plugins(int count)
{
    return QStringLiteral("%1 plug-in%2").arg(count).arg(QLatin1String(count == 1 ? "" : "s"));
}

/// Takes out what lies at or below some paths; how many there were.
template <typename List, typename PathOf>
int removeBelow(List &list, const QStringList &paths, PathOf pathOf)
{
    const auto kept = std::remove_if(list.begin(), list.end(),
                                     [&](const auto &each) { return isBelowAny(pathOf(each), paths); });
    const auto count = static_cast<int>(list.end() - kept);
    list.erase(kept, list.end());
    return count;
}

QString asItIs(const QString &path) { return path; }
QString pathOfRecord(const EffectRecord &record) { return record.path; }

int FolderEditor::run(const ScanOptions &options)
{
    if (!m_rules || !m_list) {
        refuse(QStringLiteral("%1%2 cannot be used, so nothing is changed: %3; mend it or delete it")
                   .arg(m_effectsFolder, QLatin1String(m_rules ? kScanListFile : kFolderRulesFile),
                        m_rules ? m_list.reason : m_rules.reason));
        return ScanExit::kNotFinished;
    }
    const auto each = [this](const QStringList &all, const std::function<bool(const QString &)> &act) {
        return m_exitCode == ScanExit::kDone &&
               std::all_of(all.begin(), all.end(),
                           [&](const QString &given) { return act(given) && m_exitCode == ScanExit::kDone; });
    };
    each(options.forget, [this](const QString &given) { return forget(given); });
    each(options.exclude, [this](const QString &given) { return exclude(given); });
    each(options.noExclude,
         [this](const QString &given) { return takeBack(m_rules.excluded, given, "excluded"); });
    each(options.ignore, [this](const QString &given) { return ignore(given); });
    each(options.noIgnore,
         [this](const QString &given) { return takeBack(m_rules.ignored, given, "ignored"); });
    return m_exitCode;
}

bool FolderEditor::forget(const QString &given)
{
    const QStringList paths = SearchArea::spellings(settledPath(given));
    const int folders = removeBelow(m_list.folders, paths, asItIs);
    const int records = drop(paths);
    if (m_exitCode != ScanExit::kDone)
        return false;
    if (folders == 0 && records == 0)
        return refuse(QStringLiteral("nothing is remembered of '%1'").arg(given));
    if (folders != 0)
        check(listPath(), WriteScanList(listPath(), m_list.folders));
    if (m_exitCode != ScanExit::kDone)
        return false;
    say(plugins(records) + QStringLiteral(" dropped"));
    if (isBelowAny(paths.front(), existingUsualFolders() + m_list.folders))
        say(QStringLiteral("The next scan searches %1 again; --exclude keeps it from that.").arg(given));
    return true;
}

bool FolderEditor::exclude(const QString &given)
{
    const QStringList paths = SearchArea::spellings(settledPath(given));
    m_rules.excluded += paths;
    m_rules.excluded.removeDuplicates();
    writeRules();
    const int records = m_exitCode == ScanExit::kDone ? drop(paths) : 0;
    if (m_exitCode != ScanExit::kDone)
        return false;
    say(QStringLiteral("%1 is not searched any more; %2 dropped").arg(given, plugins(records)));
    return true;
}

bool FolderEditor::ignore(const QString &given)
{
    const QStringList paths = SearchArea::spellings(settledPath(given));
    int known = 0;
    change([&](Records &records) {
        known += removeBelow(records, paths, pathOfRecord);
        return false; // they were counted
    });
    if (known == 0 && answers(paths.front()) && !QFileInfo::exists(paths.front()))
        return refuse(QStringLiteral("there is no plug-in or folder '%1'").arg(given));
    m_rules.ignored += paths;
    m_rules.ignored.removeDuplicates();
    if (!settleRules())
        return false;
    say(QStringLiteral("%1 is not loaded any more (%2)").arg(given, plugins(known)));
    return true;
}

bool FolderEditor::takeBack(QStringList &rule, const QString &given, const char *state)
{
    const QStringList paths = SearchArea::spellings(settledPath(given));
    const auto isGiven = [&](const QString &other) {
        return std::any_of(paths.begin(), paths.end(),
                           [&](const QString &path) { return isSamePath(path, other); });
    };
    const auto others = std::remove_if(rule.begin(), rule.end(), isGiven);
    const bool isThere = others != rule.end();
    rule.erase(others, rule.end());
    const auto isAbove = [&](const QString &other) { return isBelow(paths.front(), other); };
    const auto above = std::find_if(rule.begin(), rule.end(), isAbove);
    if (!isThere)
        return refuse(above == rule.end()
                          ? QStringLiteral("'%1' is not %2").arg(given, QLatin1String(state))
                          : QStringLiteral("'%1' is %2 with '%3'").arg(given, QLatin1String(state), *above));
    if (!settleRules())
        return false;
    say(QStringLiteral("%1 is not %2 any more; the next scan asks what is there")
            .arg(given, QLatin1String(state)));
    return true;
}

/// Drops what is known of all plug-ins below some paths, with the user's marks.
int FolderEditor::drop(const QStringList &paths)
{
    int count = 0;
    change([&](Records &records) {
        const int dropped = removeBelow(records, paths, pathOfRecord);
        count += dropped;
        return dropped != 0;
    });
    ProbeMemory memory(m_effectsFolder);
    for (const PluginFormatInfo &format : pluginFormats())
        memory.keepOnly(format.format, [&](const QString &path) { return !isBelowAny(path, paths); });
    check(m_effectsFolder + QLatin1String(kProbeMemoryFile), memory.write());
    return count;
}

/// Writes the rules, and has the catalogues say what is ignored now, so that a workstation hears of it before
/// the next scan. False when that could not be done.
bool FolderEditor::settleRules()
{
    writeRules();
    if (m_exitCode != ScanExit::kDone)
        return false;
    change([this](Records &records) {
        bool hasChanged = false;
        for (EffectRecord &record : records)
            hasChanged |= settleIgnored(record, m_rules.isIgnored(record.path));
        return hasChanged;
    });
    return m_exitCode == ScanExit::kDone;
}

void FolderEditor::change(const Change &change)
{
    for (const PluginFormatInfo &format : pluginFormats()) {
        const QString path =
            format.isScanned() ? m_effectsFolder + QLatin1String(format.catalogue->fileName) : QString();
        if (path.isEmpty() || !QFile::exists(path))
            continue;
        Records records = readCatalogueFile(*format.catalogue, path).records;
        if (change(records))
            check(path, replaceFile(path, renderCatalogue(*format.catalogue, records), Durability::Synced));
    }
}

void FolderEditor::writeRules()
{
    check(m_effectsFolder + QLatin1String(kFolderRulesFile), writeFolderRules(m_effectsFolder, m_rules));
}

/// Says why a command makes no sense; false.
bool FolderEditor::refuse(const QString &reason)
{
    Terminal::printError(QStringLiteral("fxscan: %1\n").arg(Terminal::harmless(reason)));
    m_exitCode = ScanExit::kUsage;
    return false;
}

void FolderEditor::check(const QString &file, const FileResult &written)
{
    if (written)
        return;
    refuse(QStringLiteral("cannot write %1: %2").arg(file, written.reason));
    m_exitCode = ScanExit::kNotFinished;
}

} // namespace

bool isFolderCommand(const ScanOptions &options)
{
    return !(options.forget + options.exclude + options.noExclude + options.ignore + options.noIgnore)
                .isEmpty();
}

int runFolderCommand(const ScanOptions &options, const QString &effectsFolder)
{
    return FolderEditor(effectsFolder).run(options);
}
