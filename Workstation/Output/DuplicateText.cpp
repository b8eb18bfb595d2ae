#include "Workstation/Output/DuplicateText.h"

#include "Workstation/Output/Terminal.h"

#include <QStringList>

#include <algorithm>

namespace {

QString render(const Duplicate &duplicate)
{
    QString text = QStringLiteral("  ") + Terminal::harmless(duplicate.name);
    if (!duplicate.vendor.isEmpty())
        text += QStringLiteral(" (%1)").arg(Terminal::harmless(duplicate.vendor));
    if (duplicate.isOneOfEachFormat()) {
        QStringList formats;
        for (const DuplicateMember &member : duplicate.members)
            formats.append(QString::fromLatin1(member.format->title));
        return text + QStringLiteral(": %1, all used\n").arg(formats.join(QLatin1String(", ")));
    }
    text += QLatin1Char('\n');
    for (const DuplicateMember &member : duplicate.members)
        text += QStringLiteral("    %1  %2  %3%4\n")
                    .arg(QLatin1String(member.isUsed ? "used    " : "not used"),
                         QLatin1String(member.format->title), Terminal::harmless(member.path),
                         member.isUsed ? QString() : QStringLiteral(": ") + Terminal::harmless(member.why));
    return text;
}

} // namespace

QString renderDuplicates(const ScanSummary &summary)
{
    if (summary.duplicates.empty())
        return QString();
    QString text = QStringLiteral("More than once:\n");
    for (const Duplicate &duplicate : summary.duplicates)
        text += render(duplicate);
    const auto isMoreThanOneUsed = [](const Duplicate &duplicate) { return duplicate.members[1].isUsed; };
    if (std::any_of(summary.duplicates.begin(), summary.duplicates.end(), isMoreThanOneUsed))
        text += QStringLiteral("  To leave one out: fxscan --switch-off PATH\n");
    return text + QLatin1Char('\n');
}
