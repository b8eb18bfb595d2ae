#include "Workstation/SummaryOutput.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>

namespace {

constexpr int kSchema = 1;

QJsonValue channels(qint32 count) { return count < 0 ? QJsonValue() : QJsonValue(count); }

QJsonObject identityOf(const PluginFormat &format, const QString &name, const QString &path, quint32 subId)
{
    QJsonObject object{{QStringLiteral("format"), QLatin1String(format.key)},
                       {QStringLiteral("name"), name},
                       {QStringLiteral("path"), path}};
    if (subId != 0)
        object.insert(QStringLiteral("subId"), static_cast<qint64>(subId));
    return object;
}

QJsonObject pluginObject(const ScanSummary &summary, const CataloguedPlugin &plugin)
{
    const EffectRecord &record = plugin.record;
    const bool isVst3 = plugin.format == &pluginFormats().front();
    QJsonObject object = identityOf(*plugin.format, record.name, record.path, record.subId);
    object.insert(QStringLiteral("id"), record.id);
    object.insert(QStringLiteral("vendor"), record.vendor);
    object.insert(QStringLiteral("categories"), QJsonArray::fromStringList(plugin.categories()));
    object.insert(QStringLiteral("inputs"), isVst3 ? channels(record.inputs) : QJsonValue());
    object.insert(QStringLiteral("outputs"), isVst3 ? QJsonValue() : channels(record.width));
    object.insert(QStringLiteral("state"), QLatin1String(stateText(plugin.state())));
    object.insert(QStringLiteral("favourite"), record.favourite);
    object.insert(QStringLiteral("fileTime"), record.fileTime);
    if (const PluginFailure *failure = failureOf(summary, plugin))
        object.insert(QStringLiteral("reason"), failure->reason);
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
            {QStringLiteral("slowest"), slowest}};
}

QByteArray csvField(const QString &text)
{
    QByteArray field = text.toUtf8();
    const bool isPlain = std::none_of(field.begin(), field.end(), [](char each) {
        return each == '"' || each == ',' || each == '\n' || each == '\r';
    });
    return isPlain ? field : '"' + field.replace("\"", "\"\"") + '"';
}

QByteArray csvLine(const QStringList &fields)
{
    QByteArray line;
    for (const QString &field : fields)
        line += (line.isNull() ? QByteArray() : QByteArray(",")) + csvField(field);
    return line + "\r\n";
}

} // namespace

const PluginFailure *failureOf(const ScanSummary &summary, const CataloguedPlugin &plugin)
{
    const auto found =
        std::find_if(summary.failures.begin(), summary.failures.end(), [&](const PluginFailure &failure) {
            return failure.format == plugin.format && failure.path == plugin.record.path &&
                   failure.subId == plugin.record.subId;
        });
    return found == summary.failures.end() || plugin.isUsable() ? nullptr : &*found;
}

QByteArray renderJson(const ScanSummary &summary, const QString &dataFolder, const QStringList &folders)
{
    QJsonArray plugins;
    for (const CataloguedPlugin &plugin : summary.plugins)
        plugins.append(pluginObject(summary, plugin));
    QJsonObject object{{QStringLiteral("schema"), kSchema},
                       {QStringLiteral("dataFolder"), dataFolder},
                       {QStringLiteral("plugins"), plugins},
                       {QStringLiteral("failures"), failureArray(summary.failures)},
                       {QStringLiteral("problems"), QJsonArray::fromStringList(summary.problems)}};
    if (summary.isScan) {
        object.insert(QStringLiteral("folders"), QJsonArray::fromStringList(folders));
        object.insert(QStringLiteral("noPlugins"), failureArray(summary.noPlugins));
        object.insert(QStringLiteral("scan"), scanObject(summary));
    }
    return QJsonDocument(object).toJson();
}

QByteArray renderCsv(const ScanSummary &summary)
{
    QByteArray text =
        csvLine({QStringLiteral("format"), QStringLiteral("name"), QStringLiteral("vendor"),
                 QStringLiteral("categories"), QStringLiteral("channels"), QStringLiteral("state"),
                 QStringLiteral("reason"), QStringLiteral("id"), QStringLiteral("path")});
    for (const CataloguedPlugin &plugin : summary.plugins) {
        const PluginFailure *failure = failureOf(summary, plugin);
        text += csvLine({QString::fromLatin1(plugin.format->key), plugin.record.name, plugin.record.vendor,
                         plugin.categories().join(QLatin1Char(';')), channelsText(plugin),
                         QString::fromLatin1(stateText(plugin.state())),
                         failure ? failure->reason : QString(), plugin.record.id, plugin.record.path});
    }
    for (const PluginFailure &failure : summary.failures) {
        const bool isListed =
            std::any_of(summary.plugins.begin(), summary.plugins.end(), [&](const CataloguedPlugin &plugin) {
                return failureOf(summary, plugin) == &failure;
            });
        if (!isListed)
            text += csvLine({QString::fromLatin1(failure.format->key), failure.name, QString(), QString(),
                             QString(), QString::fromLatin1(stateText(failure.state)), failure.reason,
                             QString(), failure.path});
    }
    return text;
}
