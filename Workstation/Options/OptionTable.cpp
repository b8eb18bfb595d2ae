#include "Workstation/Options/OptionTable.h"

#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <algorithm>

namespace {

void setFormat(ScanOptions &options, size_t choice)
{
    constexpr OutputFormat kFormats[] = {OutputFormat::Table, OutputFormat::Json, OutputFormat::JsonLines,
                                         OutputFormat::Csv, OutputFormat::Html};
    options.format = kFormats[choice];
}

/// What `PluginFilter` understands.
QStringList filterWords()
{
    QStringList words{QStringLiteral("ok"),          QStringLiteral("failed"),
                      QStringLiteral("disabled"),    QStringLiteral("switched-off"),
                      QStringLiteral("folder-away"), QStringLiteral("file-gone"),
                      QStringLiteral("ignored"),     QStringLiteral("not-asked"),
                      QStringLiteral("favourite"),   QStringLiteral("instrument")};
    for (const PluginFormatInfo &format : pluginFormats())
        if (format.isScanned())
            words += QString::fromLatin1(format.key);
    return words + QStringList{QStringLiteral("category="), QStringLiteral("vendor=")};
}

QStringList wordsOf(const ChoiceTarget &target)
{
    QStringList words;
    for (const char *choice : target.choices)
        words += QString::fromLatin1(choice);
    return words;
}

/// "table, json, jsonl or csv"
QString inWords(const QStringList &choices)
{
    const QString most = choices.mid(0, choices.size() - 1).join(QLatin1String(", "));
    return most + QLatin1String(" or ") + choices.last();
}

/// Stores one value in whatever kind of target the row has; returns what is wrong.
struct ValueStore {
    const OptionRow &row;
    const QString &value;
    ScanOptions &options;

    QString operator()(bool ScanOptions::*member) const
    {
        options.*member = true;
        return QString();
    }

    QString operator()(QString ScanOptions::*member) const
    {
        options.*member = value;
        return checkNotEmpty();
    }

    QString operator()(QStringList ScanOptions::*member) const
    {
        options.*member += value;
        return checkNotEmpty();
    }

    QString operator()(const NumberTarget &number) const
    {
        bool isNumber = false;
        const int given = value.toInt(&isNumber);
        if (!isNumber || given < number.least || given > number.most)
            return QStringLiteral("--%1 must be %2 to %3 %4, not '%5'")
                .arg(QLatin1String(row.name))
                .arg(number.least)
                .arg(number.most)
                .arg(QLatin1String(number.unit), value);
        options.*number.member = given;
        return QString();
    }

    QString operator()(const ChoiceTarget &target) const
    {
        for (size_t i = 0; i < target.choices.size(); ++i) {
            if (value == QLatin1String(target.choices[i])) {
                target.choose(options, i);
                return QString();
            }
        }
        return QStringLiteral("unknown %1 '%2'; use %3")
            .arg(QLatin1String(row.name), value, inWords(wordsOf(target)));
    }

    QString operator()(const WordsTarget &target) const
    {
        const QStringList words = target.words();
        const bool isKnown = std::any_of(words.begin(), words.end(), [&](const QString &word) {
            return word.endsWith(QLatin1Char('=')) ? value.startsWith(word) && value != word : value == word;
        });
        options.*target.member += value;
        return isKnown ? QString()
                       : QStringLiteral("unknown word '%1' for --%2; use %3")
                             .arg(value, QLatin1String(row.name), inWords(words));
    }

private:
    QString checkNotEmpty() const
    {
        if (!value.isEmpty())
            return QString();
        return QStringLiteral("--%1 needs a %2").arg(QLatin1String(row.name), QLatin1String(row.valueName));
    }
};

} // namespace

const std::vector<OptionRow> &optionTable()
{
    static const std::vector<OptionRow> rows = {
        {"data-folder", "folder", &ScanOptions::dataFolder,
         "Keep the catalogues in the folder Effects of this folder."},
        {"exclude", "folder", &ScanOptions::exclude,
         "Never search a folder, or anything below it, and drop what is known of its plug-ins.",
         "Makes no scan. To keep categories and favourites, use --ignore."},
        {"favourite", "name", &ScanOptions::favourite,
         "Mark a plug-in as a favourite; its name, its file's name (all plug-ins in it) or its path. Can be "
         "given several times.",
         "Makes no scan. Where several files have plug-ins of that name, give the path."},
        {"folders", "", &ScanOptions::foldersOnly,
         "Print the folders that a scan without arguments searches, with the number of plug-ins known in "
         "each, "
         "and what is excluded and ignored; without a scan.",
         "On a terminal as a table; otherwise one a line, with tabs between the folder, the number, and what "
         "is "
         "to be said of it: usual, not there, gives no answer, excluded or ignored."},
        {"forget", "folder", &ScanOptions::forget,
         "Forget a folder and what is known of the plug-ins below it, with categories and favourites.",
         "Makes no scan. For a drive that is gone for good: what is known of one that is away is kept "
         "otherwise."},
        {"format", "format", ChoiceTarget{{"table", "json", "jsonl", "csv", "html"}, setFormat},
         "Print the result as table (the default), json, jsonl, csv or html.",
         "jsonl prints one JSON object a line while the scan goes on: what each probe came to, and the "
         "result as the last one. In csv a text that a spreadsheet would take for a formula, as it begins "
         "with "
         "=, +, - or @, has an apostrophe in front."},
        {"html", "file", &ScanOptions::html,
         "Also write the result to a file as a page for browsers, with a picture of the scan.",
         "The page needs no network and no other file."},
        {"ignore", "path", &ScanOptions::ignore,
         "Never load a plug-in, or any below a folder; it is listed as ignored.",
         "Makes no scan. Its categories and favourites are kept, and so is what is known of it. The "
         "workstation does not offer it."},
        {"in-process", "", &ScanOptions::inProcess,
         "Load the plug-ins into this process. One that crashes takes it along.",
         "Its marker stays for the next scan. A plug-in that hangs is not ended."},
        {"jobs", "number", NumberTarget{&ScanOptions::jobs, 0, 64, "plug-ins at once"},
         "Probe this many plug-ins at once, each in a process of its own; 0 (the default): as many as suit "
         "the "
         "machine."},
        {"list", "", &ScanOptions::listOnly, "Print the catalogue as it is, without a scan.",
         "Nothing is changed."},
        {"memory-limit", "MiB", NumberTarget{&ScanOptions::memoryLimit, 0, 1 << 20, "MiB"},
         "Give up on a plug-in that takes more memory than this; 0 (the default): half of the machine's, "
         "divided "
         "by the number of jobs."},
        {"no-exclude", "folder", &ScanOptions::noExclude, "Search an excluded folder again."},
        {"no-favourite", "name", &ScanOptions::noFavourite, "Take the mark of a favourite away."},
        {"no-ignore", "path", &ScanOptions::noIgnore, "Load an ignored plug-in again."},
        {"only", "word", WordsTarget{&ScanOptions::only, filterWords},
         "Show only some plug-ins: %1 (a part of the name is enough). Can be given several times.",
         "Of several words of one kind one must fit: --only failed --only disabled shows both. Words of "
         "different kinds must all fit: --only vst3 --only instrument shows instruments in that format. It "
         "changes what is printed, in every format, not what is scanned, nor the exit code."},
        {"quiet", "", &ScanOptions::quiet, "Show no progress."},
        {"rescan", "name", &ScanOptions::rescan,
         "Probe a plug-in again although its file did not change. Can be given several times.",
         "Categories and favourites are kept. One that is disabled needs --retry."},
        {"rescan-all", "", &ScanOptions::rescanAll,
         "Probe all plug-ins again, but for those that are disabled or switched off.",
         "With --retry-failed those that are disabled as well."},
        {"retry", "name", &ScanOptions::retry,
         "Probe a plug-in again that is disabled or does not work; its name, its file's name or its path. "
         "Can be given several times.",
         "Where several files have plug-ins of that name, give the path. Without a folder the folders of "
         "the last scan are scanned. What the user switched off stays so; categories and favourites are "
         "kept."},
        {"retry-changed", "", &ScanOptions::retryChanged,
         "Probe those again that are disabled and whose file changed since, and those that lacked a library "
         "which is there now."},
        {"retry-failed", "", &ScanOptions::retryFailed,
         "Probe all plug-ins again that are disabled or do not work."},
        {"show", "name", &ScanOptions::show,
         "Print everything known of a plug-in, with its last probe and crash report, without a scan. Can be "
         "given several times.",
         "Where several plug-ins have the name, all are shown. With --format json too."},
        {"show-window", "", &ScanOptions::showWindow, "Let the scanner show its window."},
        {"strict", "", &ScanOptions::strict, "Exit with 1 when a plug-in cannot be used."},
        {"switch-off", "name", &ScanOptions::switchOff,
         "Switch a plug-in off: it stays in the catalogue, but the workstation does not offer it. Can be "
         "given several times.",
         "Makes no scan. The name of a file means all plug-ins in it."},
        {"switch-on", "name", &ScanOptions::switchOn, "Switch a plug-in on again."},
        {"timeout", "seconds", NumberTarget{&ScanOptions::timeout, 0, 86400, "seconds"},
         "Give up on a plug-in that does not answer for this many seconds (default 60); 0: never."},
    };
    return rows;
}

const std::vector<const char *> &optionsWithoutScan()
{
    static const std::vector<const char *> names = {"exclude",   "favourite",  "folders",    "forget",
                                                    "ignore",    "list",       "no-exclude", "no-favourite",
                                                    "no-ignore", "switch-off", "switch-on",  "show"};
    return names;
}

const std::vector<OptionConflict> &optionConflicts()
{
    static const std::vector<OptionConflict> conflicts = [] {
        std::vector<OptionConflict> all = {
            {"in-process", "jobs", "--in-process probes one plug-in after the other"},
            {"in-process", "memory-limit", "--in-process cannot end a plug-in that takes too much"},
            {"in-process", "timeout", "--in-process cannot end a plug-in that hangs"},
            {"in-process", "show-window", "--in-process has no window"},
        };
        for (const char *option : optionsWithoutScan()) {
            const QString reason = QStringLiteral("--%1 makes no scan").arg(QLatin1String(option));
            for (const char *ofScan : {"retry", "retry-changed", "retry-failed", "rescan", "rescan-all",
                                       "in-process", "jobs", "memory-limit", "show-window", "timeout"})
                all.push_back({option, ofScan, reason});
        }
        for (const char *option : optionsWithoutScan())
            if (qstrcmp(option, "list") != 0 && qstrcmp(option, "show") != 0)
                for (const char *ofOutput : {"only", "format", "html", "strict"})
                    all.push_back({option, ofOutput,
                                   QStringLiteral("--%1 prints no plug-ins").arg(QLatin1String(option))});
        all.push_back({"show", "only", QStringLiteral("--show shows what it names")});
        for (const char *first : {"folders", "list", "show"})
            for (const char *other : optionsWithoutScan())
                if (qstrcmp(first, other) != 0)
                    all.push_back(
                        {first, other, QStringLiteral("--%1 stands alone").arg(QLatin1String(first))});
        return all;
    }();
    return conflicts;
}

QString helpOf(const OptionRow &row)
{
    const QString help = QString::fromLatin1(row.help);
    const WordsTarget *const target = std::get_if<WordsTarget>(&row.target);
    return target ? help.arg(inWords(target->words())) : help;
}

QList<QCommandLineOption> commandLineOptions()
{
    QList<QCommandLineOption> options;
    for (const OptionRow &row : optionTable())
        options += QCommandLineOption(QString::fromLatin1(row.name), helpOf(row),
                                      QString::fromLatin1(row.valueName));
    return options;
}

QString storeValues(const OptionRow &row, const QStringList &values, ScanOptions &options)
{
    for (const QString &value : row.isSwitch() ? QStringList(QString()) : values)
        if (QString wrong = std::visit(ValueStore{row, value, options}, row.target); !wrong.isEmpty())
            return wrong;
    return QString();
}
