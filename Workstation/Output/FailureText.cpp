#include "Workstation/Output/FailureText.h"

#include "Workstation/Output/Terminal.h"

#include <QRegularExpression>

#include <algorithm>
#include <map>

namespace {

/// Plug-ins of one file that fail for the same reason.
struct FailedFile {
    const PluginFailure *first;
    QStringList names;
};

/// Files with the same reason, in the order of the first ones.
struct Group {
    QString reason;
    std::vector<FailedFile> files;
};

std::vector<Group> groupsOf(const std::vector<PluginFailure> &failures)
{
    std::vector<Group> groups;
    std::map<QString, std::size_t> places;
    for (const PluginFailure &failure : failures) {
        const auto [place, isNew] = places.emplace(failure.reason, groups.size());
        if (isNew)
            groups.push_back({failure.reason, {}});
        std::vector<FailedFile> &files = groups[place->second].files;
        const auto same = std::find_if(files.begin(), files.end(), [&](const FailedFile &file) {
            return file.first->path == failure.path && file.first->state == failure.state;
        });
        if (same == files.end())
            files.push_back({&failure, {failure.name}});
        else
            same->names.append(failure.name);
    }
    return groups;
}

/// What to give to `--retry`: the name, unless another plug-in that cannot be used has it as well.
QString nameFor(const PluginFailure &failure, const std::vector<PluginFailure> &failures)
{
    const bool isAmbiguous = std::any_of(failures.begin(), failures.end(), [&](const PluginFailure &other) {
        return other.path != failure.path && other.name.compare(failure.name, Qt::CaseInsensitive) == 0;
    });
    return shellWord(Terminal::harmless(isAmbiguous ? failure.path : failure.name));
}

QString title(const FailedFile &file)
{
    return QStringLiteral("%1 (%2, %3)")
        .arg(Terminal::harmless(file.names.join(QLatin1String(", "))),
             QLatin1String(file.first->format->title), QLatin1String(stateText(file.first->state)));
}

QString changed(const FailedFile &file, const ScanSummary &summary)
{
    return file.first->hasChanged ? QStringLiteral("    changed since it crashed: fxscan --retry %1\n")
                                        .arg(nameFor(*file.first, summary.failures))
                                  : QString();
}

QString renderGroup(const Group &group, const ScanSummary &summary)
{
    const QString reason = Terminal::harmless(group.reason);
    QString text;
    if (group.files.size() > 1)
        text = QStringLiteral("  %1 files: %2.\n").arg(group.files.size()).arg(reason);
    for (const FailedFile &file : group.files) {
        const QString path = Terminal::harmless(file.first->path);
        text += group.files.size() > 1 ? QStringLiteral("    %1  %2\n").arg(title(file), path)
                                       : QStringLiteral("  %1: %2.\n    %3\n").arg(title(file), reason, path);
        text += changed(file, summary);
    }
    return text;
}

} // namespace

QString shellWord(const QString &text)
{
    static const QRegularExpression special(QStringLiteral("[^\\w./:+-]"),
                                            QRegularExpression::UseUnicodePropertiesOption);
    if (!text.contains(special) && !text.isEmpty())
        return text;
    QString quoted = text;
#ifdef _WIN32 // whose shells know no other quotes, and no way to write one inside
    return QLatin1Char('"') + quoted.remove(QLatin1Char('"')) + QLatin1Char('"');
#else
    return QLatin1Char('\'') + quoted.replace(QLatin1Char('\''), QLatin1String("'\\''")) + QLatin1Char('\'');
#endif
}

QString renderFailures(const ScanSummary &summary)
{
    if (summary.failures.empty())
        return QString();
    QString text = QStringLiteral("Cannot be used:\n");
    for (const Group &group : groupsOf(summary.failures))
        text += renderGroup(group, summary);
    const bool canRetry =
        std::any_of(summary.failures.begin(), summary.failures.end(), [](const PluginFailure &failure) {
            return failure.state == PluginState::Failed || failure.state == PluginState::Disabled;
        });
    if (canRetry)
        text += QStringLiteral("  To try again: fxscan --retry NAME; all of them: fxscan --retry-failed\n");
    return text + QLatin1Char('\n');
}
