#include "Workstation/ScanOptions.h"

#include "Workstation/PluginFolders.h"

#include <QCommandLineParser>
#include <QDir>
#include <QFileInfo>

namespace {

constexpr int kMaxTimeout = 86400; ///< seconds

const QCommandLineOption &option(const char *name)
{
    static const std::map<QString, QCommandLineOption> options = [] {
        const auto text = [](const char *latin1) { return QString::fromLatin1(latin1); };
        std::map<QString, QCommandLineOption> made;
        const auto add = [&](const char *key, const char *help, const char *value = "") {
            made.emplace(text(key), QCommandLineOption(text(key), text(help), text(value)));
        };
        add("data-folder", "Keep the catalogues in the folder Effects of this folder.", "folder");
        add("format", "Print the result as table (the default), json or csv.", "format");
        add("in-process", "Load the plug-ins into this process. One that crashes takes it along.");
        add("list", "Print the catalogue as it is, without a scan.");
        add("quiet", "Show no progress.");
        add("retry",
            "Probe a plug-in again that is disabled or does not work; its name, its file's name or its "
            "path. Can be given several times.",
            "name");
        add("retry-failed", "The same for all such plug-ins.");
        add("show-window", "Let the scanner show its window.");
        add("strict", "Exit with 1 when a plug-in cannot be used.");
        add("timeout",
            "Give up on a plug-in that does not answer for so many seconds (default 60); 0: never.",
            "seconds");
        return made;
    }();
    return options.at(QString::fromLatin1(name));
}

constexpr const char *kOptionNames[] = {"data-folder", "format",       "in-process",  "list",   "quiet",
                                        "retry",       "retry-failed", "show-window", "strict", "timeout"};

/// Takes the values of options that have one; gives what is wrong with them.
QString readValues(const QCommandLineParser &parser, ScanOptions &options)
{
    if (parser.isSet(option("format"))) {
        const QString format = parser.value(option("format"));
        if (format != QLatin1String("table") && format != QLatin1String("json") &&
            format != QLatin1String("csv"))
            return QStringLiteral("'%1' is no format: table, json or csv").arg(format);
        options.format = format == QLatin1String("json")  ? OutputFormat::Json
                         : format == QLatin1String("csv") ? OutputFormat::Csv
                                                          : OutputFormat::Table;
    }
    if (parser.isSet(option("timeout"))) {
        const QString timeout = parser.value(option("timeout"));
        bool isNumber = false;
        options.timeout = timeout.toInt(&isNumber);
        if (!isNumber || options.timeout < 0 || options.timeout > kMaxTimeout)
            return QStringLiteral("'%1' is no number of seconds from 0 to %2").arg(timeout).arg(kMaxTimeout);
    }
    options.retry = parser.values(option("retry"));
    if (options.retry.contains(QString()))
        return QStringLiteral("--retry needs a name");
    options.dataFolder = parser.value(option("data-folder"));
    if (parser.isSet(option("data-folder")) && options.dataFolder.isEmpty())
        return QStringLiteral("--data-folder needs a folder");
    return QString();
}

QString checkTogether(const ScanOptions &options, bool hasTimeout)
{
    if (options.listOnly && (options.isRetry() || options.inProcess || !options.folders.isEmpty()))
        return QStringLiteral("--list makes no scan: it takes no folders, --retry or --in-process");
    if (options.inProcess && hasTimeout)
        return QStringLiteral("--timeout has no effect with --in-process: nobody could end a plug-in");
    if (options.inProcess && options.showWindow)
        return QStringLiteral("--in-process has no window to show");
    return QString();
}

} // namespace

CommandLine readCommandLine(const QStringList &arguments)
{
    QCommandLineParser parser;
    parser.setApplicationDescription(QStringLiteral(
        "Finds the VST 3 and VST 2 plug-ins of this machine and says which of them can be used.\n\n"
        "Exit codes: 0 done, 1 done but some plug-ins cannot be used (with --strict), 2 wrong usage,\n"
        "3 the scan did not come to its end."));
    const QCommandLineOption help = parser.addHelpOption();
    const QCommandLineOption version = parser.addVersionOption();
    for (const char *name : kOptionNames)
        parser.addOption(option(name));
    parser.addPositionalArgument(
        QStringLiteral("folder"),
        QStringLiteral("Folders to scan, with all below them. None: the usual plug-in folders."),
        QStringLiteral("[folder...]"));
    CommandLine line;
    const bool isParsed = parser.parse(arguments);
    if (isParsed && parser.isSet(help))
        line.text = parser.helpText();
    else if (isParsed && parser.isSet(version))
        line.text = QCoreApplication::applicationName() + QLatin1Char(' ') +
                    QCoreApplication::applicationVersion() + QLatin1Char('\n');
    if (!line.text.isEmpty())
        return line;
    ScanOptions &options = line.options;
    QString wrong = isParsed ? readValues(parser, options) : parser.errorText();
    options.folders = parser.positionalArguments();
    options.listOnly = parser.isSet(option("list"));
    options.inProcess = parser.isSet(option("in-process"));
    options.quiet = parser.isSet(option("quiet"));
    options.retryFailed = parser.isSet(option("retry-failed"));
    options.showWindow = parser.isSet(option("show-window"));
    options.strict = parser.isSet(option("strict"));
    if (options.dataFolder.isEmpty())
        options.dataFolder = userDataFolder();
    options.dataFolder = QDir::cleanPath(QFileInfo(options.dataFolder).absoluteFilePath());
    if (wrong.isEmpty())
        wrong = checkTogether(options, parser.isSet(option("timeout")));
    line.isError = !wrong.isEmpty();
    if (line.isError)
        line.text = QStringLiteral("fxscan: %1\nTry 'fxscan --help'.\n").arg(wrong);
    return line;
}
