#include "Workstation/Output/JsonLines.h"
#include "Workstation/Output/SummaryOutput.h"

#include <QByteArrayList>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>

namespace {

QJsonValue channels(qint32 count) { return count < 0 ? QJsonValue() : QJsonValue(count); }

QJsonObject identityOf(const PluginFormatInfo &format, const QString &name, const QString &path,
                       quint32 subId)
{
    QJsonObject object{{QStringLiteral("format"), QLatin1String(format.key)},
                       {QStringLiteral("name"), name},
                       {QStringLiteral("path"), path}};
    if (subId != 0)
        object.insert(QStringLiteral("subId"), static_cast<qint64>(subId));
    return object;
}

/// What the last probe of a plug-in's file came to.
QJsonObject probeObject(const RememberedProbe &probe, quint32 subId)
{
    QJsonObject object{{QStringLiteral("status"), QLatin1String(statusText(probe.status))},
                       {QStringLiteral("stage"), QLatin1String(stageText(probe.stage))},
                       {QStringLiteral("milliseconds"), probe.milliseconds},
                       {QStringLiteral("fileTime"), probe.fileTime},
                       {QStringLiteral("frames"), QJsonArray::fromStringList(probe.framesOf(subId))}};
    if (const QString reason = probe.reasonOf(subId); !reason.isEmpty())
        object.insert(QStringLiteral("reason"), reason);
    return object;
}

QJsonArray duplicateArray(const std::vector<Duplicate> &duplicates)
{
    QJsonArray array;
    for (const Duplicate &duplicate : duplicates) {
        QJsonArray members;
        for (const DuplicateMember &member : duplicate.members) {
            QJsonObject object{{QStringLiteral("format"), QLatin1String(member.format->key)},
                               {QStringLiteral("path"), member.path},
                               {QStringLiteral("used"), member.isUsed}};
            if (!member.why.isEmpty())
                object.insert(QStringLiteral("reason"), member.why);
            members.append(object);
        }
        array.append(QJsonObject{{QStringLiteral("name"), duplicate.name},
                                 {QStringLiteral("vendor"), duplicate.vendor},
                                 {QStringLiteral("members"), members}});
    }
    return array;
}

QJsonObject pluginObject(const CataloguedPlugin &plugin)
{
    const EffectRecord &record = plugin.record;
    QJsonObject object = identityOf(*plugin.format, record.name, record.path, record.subId);
    object.insert(QStringLiteral("id"), record.id);
    object.insert(QStringLiteral("vendor"), record.vendor);
    object.insert(QStringLiteral("categories"), QJsonArray::fromStringList(plugin.categories()));
    object.insert(QStringLiteral("inputs"), channels(plugin.inputs));
    object.insert(QStringLiteral("outputs"), channels(plugin.outputs));
    object.insert(QStringLiteral("state"), QLatin1String(stateText(plugin.state())));
    object.insert(QStringLiteral("favourite"), record.favourite);
    object.insert(QStringLiteral("fileTime"), record.fileTime);
    if (!plugin.reason.isEmpty())
        object.insert(QStringLiteral("reason"), plugin.reason);
    if (plugin.hasChanged)
        object.insert(QStringLiteral("changed"), true);
    if (plugin.probe)
        object.insert(QStringLiteral("probe"), probeObject(*plugin.probe, record.subId));
    return object;
}

QJsonArray failureArray(const std::vector<PluginFailure> &failures)
{
    QJsonArray array;
    for (const PluginFailure &failure : failures) {
        QJsonObject object = identityOf(*failure.format, failure.name, failure.path, failure.subId);
        object.insert(QStringLiteral("state"), QLatin1String(stateText(failure.state)));
        object.insert(QStringLiteral("reason"), failure.reason);
        array.append(object);
    }
    return array;
}

QJsonObject scanObject(const ScanSummary &summary)
{
    QJsonArray slowest;
    for (const ProbeTime &probe : summary.slowest)
        slowest.append(QJsonObject{{QStringLiteral("path"), probe.path},
                                   {QStringLiteral("milliseconds"), probe.milliseconds}});
    return {{QStringLiteral("finished"), summary.finished},
            {QStringLiteral("new"), summary.added},
            {QStringLiteral("updated"), summary.updated},
            {QStringLiteral("unchanged"), summary.unchanged},
            {QStringLiteral("removed"), QJsonArray::fromStringList(summary.removed)},
            {QStringLiteral("skipped"), QJsonArray::fromStringList(summary.skipped)},
            {QStringLiteral("slowest"), slowest}};
}

/// A spreadsheet takes a field for a formula that begins with one of these, also a quoted one, and carries it
/// out: OWASP, "CSV Injection".
bool isFormula(const QString &text)
{
    return !text.isEmpty() && QStringLiteral("=+-@\t\r\n＝＋－＠").contains(text.front());
}

QByteArray csvText(const QString &text)
{
    const QByteArray field = ((isFormula(text) ? QStringLiteral("'") : QString()) + text).toUtf8();
    const bool isPlain = std::none_of(field.begin(), field.end(), [](char each) {
        return each == '"' || each == ',' || each == '\n' || each == '\r';
    });
    return isPlain ? field : '"' + QByteArray(field).replace("\"", "\"\"") + '"';
}

/// Nothing for what is unknown.
QByteArray csvNumber(qint64 value) { return value < 0 ? QByteArray() : QByteArray::number(value); }
QByteArray csvSubId(quint32 id) { return csvNumber(id == 0 ? -1 : qint64(id)); }

QByteArray csvLine(const QByteArrayList &fields) { return fields.join(',') + "\r\n"; }

} // namespace

QJsonObject summaryObject(const ScanSummary &summary, const QString &dataFolder, const QStringList &folders)
{
    QJsonArray plugins;
    for (const CataloguedPlugin &plugin : summary.plugins)
        plugins.append(pluginObject(plugin));
    QJsonObject object{{QStringLiteral("schema"), JsonLines::kSchema},
                       {QStringLiteral("dataFolder"), dataFolder},
                       {QStringLiteral("plugins"), plugins},
                       {QStringLiteral("failures"), failureArray(summary.failures)},
                       {QStringLiteral("duplicates"), duplicateArray(summary.duplicates)},
                       {QStringLiteral("problems"), QJsonArray::fromStringList(summary.problems)}};
    if (summary.isScan) {
        object.insert(QStringLiteral("folders"), QJsonArray::fromStringList(folders));
        object.insert(QStringLiteral("noPlugins"), failureArray(summary.noPlugins));
        object.insert(QStringLiteral("scan"), scanObject(summary));
    }
    return object;
}

QByteArray renderJson(const ScanSummary &summary, const QString &dataFolder, const QStringList &folders)
{
    return QJsonDocument(summaryObject(summary, dataFolder, folders)).toJson();
}

QByteArray renderJsonLine(const ScanSummary &summary, const QString &dataFolder, const QStringList &folders)
{
    QJsonObject object = summaryObject(summary, dataFolder, folders);
    object.insert(QStringLiteral("type"), QStringLiteral("summary"));
    return QJsonDocument(object).toJson(QJsonDocument::Compact) + '\n';
}

QByteArray renderCsv(const ScanSummary &summary)
{
    QByteArray text = csvLine({"format", "name", "vendor", "categories", "inputs", "outputs", "state",
                               "reason", "id", "path", "subId"});
    for (const CataloguedPlugin &plugin : summary.plugins) {
        const EffectRecord &record = plugin.record;
        text += csvLine({plugin.format->key, csvText(record.name), csvText(record.vendor),
                         csvText(plugin.categories().join(QLatin1Char(';'))), csvNumber(plugin.inputs),
                         csvNumber(plugin.outputs), stateText(plugin.state()), csvText(plugin.reason),
                         csvText(record.id), csvText(record.path), csvSubId(record.subId)});
    }
    for (const PluginFailure &failure : summary.failures)
        if (!failure.isCatalogued)
            text +=
                csvLine({failure.format->key, csvText(failure.name), "", "", "", "", stateText(failure.state),
                         csvText(failure.reason), "", csvText(failure.path), csvSubId(failure.subId)});
    return text;
}
