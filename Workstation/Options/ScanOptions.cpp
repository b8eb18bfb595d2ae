#include "Workstation/Options/ScanOptions.h"

#include "Workstation/Options/OptionTable.h"
#include "Workstation/Options/PluginFolders.h"

#include <QCommandLineParser>
#include <QDir>
#include <QFileInfo>

namespace {

/// Stores what was given for each option; returns what is wrong with it.
QString readOptions(const QCommandLineParser &parser, ScanOptions &options)
{
    for (const OptionRow &row : optionTable()) {
        const QString name = QString::fromLatin1(row.name);
        if (!parser.isSet(name))
            continue;
        if (QString wrong = storeValues(row, parser.values(name), options); !wrong.isEmpty())
            return wrong;
    }
    return QString();
}

QString checkTogether(const QCommandLineParser &parser)
{
    for (const OptionConflict &conflict : optionConflicts())
        if (parser.isSet(QString::fromLatin1(conflict.option)) &&
            parser.isSet(QString::fromLatin1(conflict.other)))
            return QStringLiteral("%1; it cannot be combined with --%2")
                .arg(conflict.reason, QLatin1String(conflict.other));
    for (const char *name : optionsWithoutScan()) {
        const QString option = QString::fromLatin1(name);
        if (parser.isSet(option) && !parser.positionalArguments().isEmpty())
            return QStringLiteral("--%1 makes no scan; it takes no folders").arg(option);
    }
    return QString();
}

} // namespace

CommandLine readCommandLine(const QStringList &arguments)
{
    QCommandLineParser parser;
    parser.setApplicationDescription(QStringLiteral(
        "Finds the audio plug-ins of this machine and says which of them can be used.\n\n"
        "Exit codes: 0 done, 1 done but some plug-ins cannot be used (with --strict), 2 wrong usage,\n"
        "3 the scan did not come to its end."));
    const QCommandLineOption help({QStringLiteral("h"), QStringLiteral("help")},
                                  QStringLiteral("Print this help."));
    const QCommandLineOption version({QStringLiteral("v"), QStringLiteral("version")},
                                     QStringLiteral("Print the version."));
    parser.addOptions(commandLineOptions() << help << version);
    parser.addPositionalArgument(
        QStringLiteral("folder"),
        QStringLiteral(
            "Folders to scan, with all below them, or plug-ins. They are remembered. None: all that "
            "are remembered, and the usual plug-in folders."),
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
    QString wrong = isParsed ? readOptions(parser, options) : parser.errorText();
    options.folders = parser.positionalArguments();
    if (options.dataFolder.isEmpty())
        options.dataFolder = userDataFolder();
    options.dataFolder = QDir::cleanPath(QFileInfo(options.dataFolder).absoluteFilePath());
    if (wrong.isEmpty())
        wrong = checkTogether(parser);
    line.isError = !wrong.isEmpty();
    if (line.isError)
        line.text = QStringLiteral("fxscan: %1\nTry 'fxscan --help'.\n").arg(wrong);
    return line;
}
