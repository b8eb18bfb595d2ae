#include "Scanner/ScannerHelp.h"

#include "Main/AudioEngineController/Effects/Protocol/ScannerUsage.h"

#include <QByteArray>
#include <QList>

#include <algorithm>
#include <cstdio>

namespace {

constexpr int kIndent = 24;
constexpr int kWidth = 79;

/// The row's text beside its name, broken between words.
QByteArray lines(const UsageRow &row)
{
    QByteArray text;
    QByteArray line = QByteArray("  ").append(row.name).leftJustified(kIndent - 1);
    for (const QByteArray &word : QByteArray(row.text).split(' ')) {
        if (line.size() + 1 + word.size() > kWidth) {
            text += line + '\n';
            line = QByteArray(kIndent - 1, ' ');
        }
        line += ' ' + word;
    }
    return text + line + '\n';
}

template <std::size_t Count>
QByteArray section(const char *title, const UsageRow (&rows)[Count])
{
    QByteArray text = QByteArray("\n").append(title).append(":\n");
    for (const UsageRow &row : rows)
        text += lines(row);
    return text;
}

QByteArray help()
{
    return "Usage: FxProbe [FILE | -rewire_version | --help | --version]\n"
           "Finds the audio plug-ins in the folders of a scan list and writes their catalogues.\n"
           "A workstation starts it; fxscan does so from the command line.\n" +
           section("Arguments", kScannerArguments) + section("Environment", kScannerVariables) +
           section("Exit codes", kScannerExits);
}

} // namespace

bool printHelp(const char *argument)
{
    const auto isOneOf = [argument](const char *brief, const char *full) {
        return qstrcmp(argument, brief) == 0 || qstrcmp(argument, full) == 0;
    };
    const bool isVersion = isOneOf("-v", "--version");
    if (!isVersion && !isOneOf("-h", "--help"))
        return false;
    const QByteArray text = isVersion ? QByteArrayLiteral("FxProbe " FXPROBE_VERSION "\n") : help();
    std::fputs(text.constData(), stdout);
    std::fflush(stdout);
    return true;
}
