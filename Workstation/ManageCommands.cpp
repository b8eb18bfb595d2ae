#include "Workstation/ManageCommands.h"

#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Workstation/Manage/AskAgain.h"
#include "Workstation/Manage/Marks.h"
#include "Workstation/Output/Terminal.h"

namespace {

/// Says what is wrong; the exit code that goes with it.
int concludeEdit(const QStringList &wrong, const FileResult &written)
{
    for (const QString &sentence : wrong)
        Terminal::complain(sentence);
    if (!written)
        Terminal::complain(QStringLiteral("cannot write ") + written.reason);
    return !wrong.isEmpty() ? ScanExit::kUsage : written ? ScanExit::kDone : ScanExit::kNotFinished;
}

} // namespace

int changeMarks(const ScanOptions &options, const QString &effectsFolder)
{
    const MarkOutcome outcome = setMarks(
        effectsFolder, {options.switchOff, options.switchOn, options.favourite, options.noFavourite});
    const int exitCode = concludeEdit(outcome.wrong, outcome.written);
    if (exitCode == ScanExit::kDone)
        for (const QString &line : outcome.done)
            Terminal::print(Terminal::harmless(line) + QLatin1Char('\n'));
    return exitCode;
}

int prepareAskAgain(const ScanOptions &options, const QStringList &folders, const QStringList &shown,
                    PluginHost &registry)
{
    registry.ReadCatalogue(); // absorbs the markers: the newest crash may be the one that is meant
    const ModuleLook look{
        [&](PluginFormat format, const QString &path) { return registry.host(format).moduleTime(path); },
        [&](PluginFormat format, const QString &path) {
            return PluginLibrary::hasNeededLibraries(registry.host(format).moduleLibrary(path));
        }};
    const AskAgainOutcome outcome = askAgain(
        registry.effectsFolder(),
        {options.retry, options.retryFailed, options.retryChanged, options.rescan, shown, options.rescanAll},
        folders, look);
    return concludeEdit(outcome.wrong, outcome.written);
}
