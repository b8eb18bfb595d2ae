#include "Workstation/Options/OptionTable.h"

namespace {

void setFormat(ScanOptions &options, size_t choice)
{
    constexpr OutputFormat kFormats[] = {OutputFormat::Table, OutputFormat::Json, OutputFormat::Csv};
    options.format = kFormats[choice];
}

/// "table, json or csv"
QString inWords(const std::vector<const char *> &choices)
{
    QString words;
    for (size_t i = 0; i < choices.size(); ++i) {
        if (i > 0)
            words += QLatin1String(i + 1 < choices.size() ? ", " : " or ");
        words += QLatin1String(choices[i]);
    }
    return words;
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
            .arg(QLatin1String(row.name), value, inWords(target.choices));
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
        {"folders", "", &ScanOptions::foldersOnly,
         "Print the usual plug-in folders that exist, one a line, without a scan."},
        {"forget", "folder", &ScanOptions::forget,
         "Drop what is known of the plug-ins below a folder, with categories and favourites; makes no scan.",
         "For a drive that is gone for good: what is known of one that is away is kept otherwise. A folder "
         "that "
         "is there still is scanned anew next time."},
        {"format", "format", ChoiceTarget{{"table", "json", "csv"}, setFormat},
         "Print the result as table (the default), json or csv."},
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
        {"quiet", "", &ScanOptions::quiet, "Show no progress."},
        {"retry", "name", &ScanOptions::retry,
         "Probe a plug-in again that is disabled or does not work; its name, its file's name or its path. "
         "Can be given several times.",
         "Without a folder the folders of the last scan are scanned. What the user switched off stays so; "
         "categories and favourites are kept."},
        {"retry-failed", "", &ScanOptions::retryFailed,
         "Probe all plug-ins again that are disabled or do not work."},
        {"show-window", "", &ScanOptions::showWindow, "Let the scanner show its window."},
        {"strict", "", &ScanOptions::strict, "Exit with 1 when a plug-in cannot be used."},
        {"timeout", "seconds", NumberTarget{&ScanOptions::timeout, 0, 86400, "seconds"},
         "Give up on a plug-in that does not answer for this many seconds (default 60); 0: never."},
    };
    return rows;
}

const std::vector<OptionConflict> &optionConflicts()
{
    static const std::vector<OptionConflict> conflicts = {
        {"folders", "list", "--folders makes no scan"},
        {"folders", "retry", "--folders makes no scan"},
        {"folders", "retry-failed", "--folders makes no scan"},
        {"forget", "folders", "--folders changes nothing"},
        {"forget", "list", "--list changes nothing"},
        {"forget", "retry", "--forget makes no scan"},
        {"forget", "retry-failed", "--forget makes no scan"},
        {"list", "retry", "--list makes no scan"},
        {"list", "retry-failed", "--list makes no scan"},
        {"list", "in-process", "--list makes no scan"},
        {"in-process", "jobs", "--in-process probes one plug-in after the other"},
        {"in-process", "memory-limit", "--in-process cannot end a plug-in that takes too much"},
        {"in-process", "timeout", "--in-process cannot end a plug-in that hangs"},
        {"in-process", "show-window", "--in-process has no window"},
    };
    return conflicts;
}

QList<QCommandLineOption> commandLineOptions()
{
    QList<QCommandLineOption> options;
    for (const OptionRow &row : optionTable())
        options += QCommandLineOption(QString::fromLatin1(row.name), QString::fromLatin1(row.help),
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
