#include "Workstation/Output/DetailText.h"

#include "Workstation/Output/DuplicateText.h"
#include "Workstation/Output/FailureText.h"
#include "Workstation/Output/SummaryOutput.h"
#include "Workstation/Output/Terminal.h"

namespace {

/// Lines of a name and a value, below each other.
class Lines {
public:
    explicit Lines(const QString &title)
        : m_text(Terminal::harmless(title) + QLatin1Char('\n'))
    {}

    void add(const char *name, const QString &value)
    {
        if (!value.isEmpty())
            m_text +=
                QStringLiteral("  %1  %2\n").arg(QLatin1String(name), -11).arg(Terminal::harmless(value));
    }
    void add(const char *name, const QStringList &values)
    {
        for (const QString &value : values) {
            add(name, value);
            name = "";
        }
    }
    QString text() const { return m_text + QLatin1Char('\n'); }

private:
    QString m_text;
};

void addProbe(Lines &lines, const RememberedProbe &probe, const EffectRecord &record)
{
    const bool hasFailed = probe.status != ProbeStatus::Listed && probe.status != ProbeStatus::NoPlugin;
    lines.add("last probe", QStringLiteral("%1%2, %3 ms")
                                .arg(QLatin1String(statusText(probe.status)),
                                     QLatin1String(hasFailed ? duringStage(probe.stage) : ""))
                                .arg(probe.milliseconds, 0, 'f', 1));
    if (probe.fileTime != record.fileTime && !record.fileTime.isEmpty())
        lines.add("", QStringLiteral("of the file of ") + probe.fileTime);
    lines.add("reason", probe.reasonOf(record.subId));
    lines.add("crashed at", probe.framesOf(record.subId));
}

QString detailsOf(const CataloguedPlugin &plugin)
{
    const EffectRecord &record = plugin.record;
    Lines lines(record.name);
    lines.add("format", QString::fromLatin1(plugin.format->title));
    lines.add("vendor", record.vendor);
    lines.add("state", QString::fromLatin1(stateText(plugin.state())));
    lines.add("favourite", QString::fromLatin1(record.favourite ? "yes" : ""));
    lines.add("categories", plugin.categories().join(QLatin1String(", ")));
    lines.add("in/out", channelsText(plugin));
    lines.add("latency", record.latency == 0 ? QString() : QStringLiteral("%1 samples").arg(record.latency));
    lines.add("identifier", record.id);
    if (record.subId != 0)
        lines.add("sub-plug-in", QStringLiteral("%1 (%2)").arg(record.subName).arg(record.subId));
    lines.add("file", record.path);
    lines.add("file time", record.fileTime);
    if (plugin.hasChanged)
        lines.add("", QStringLiteral("changed since it crashed: fxscan --retry ") + shellWord(record.path));
    if (plugin.probe)
        addProbe(lines, *plugin.probe, record);
    else
        lines.add("reason", plugin.reason);
    return lines.text();
}

} // namespace

QString renderDetails(const ScanSummary &summary)
{
    QString text;
    for (const CataloguedPlugin &plugin : summary.plugins)
        text += detailsOf(plugin);
    return text + renderDuplicates(summary);
}
