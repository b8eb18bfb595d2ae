#include "Workstation/Output/JsonLines.h"

#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"
#include "Workstation/Output/Terminal.h"

#include <QJsonArray>
#include <QJsonDocument>

namespace {

QJsonValue keyOf(PluginFormat format) { return QLatin1String(formatInfo(format).key); }

QJsonObject lineOf(const PlannedFormat &plan)
{
    return {{QStringLiteral("type"), QStringLiteral("plan")},
            {QStringLiteral("format"), keyOf(plan.format)},
            {QStringLiteral("files"), plan.files},
            {QStringLiteral("probes"), plan.probes}};
}

QJsonObject lineOf(const PluginKey &key, const ProbeAccount &probe)
{
    QJsonObject line{{QStringLiteral("type"), QStringLiteral("probe")},
                     {QStringLiteral("format"), keyOf(key.format)},
                     {QStringLiteral("path"), key.path},
                     {QStringLiteral("status"), QLatin1String(statusText(probe.status))},
                     {QStringLiteral("records"), probe.records},
                     {QStringLiteral("milliseconds"),
                      probe.milliseconds < 0 ? QJsonValue() : QJsonValue(probe.milliseconds)}};
    if (key.subId != 0)
        line.insert(QStringLiteral("subId"), static_cast<qint64>(key.subId));
    if (!probe.subName.isEmpty())
        line.insert(QStringLiteral("subName"), probe.subName);
    if (!probe.reason.isEmpty())
        line.insert(QStringLiteral("reason"), probe.reason);
    if (probe.worker != 0)
        line.insert(QStringLiteral("worker"), probe.worker);
    return line;
}

} // namespace

void JsonLines::begin(const QString &dataFolder, const QStringList &folders)
{
    print({{QStringLiteral("type"), QStringLiteral("begin")},
           {QStringLiteral("schema"), kSchema},
           {QStringLiteral("dataFolder"), dataFolder},
           {QStringLiteral("folders"), QJsonArray::fromStringList(folders)}});
}

void JsonLines::show(ScanAccount &account)
{
    for (const ScanNews &news : account.takeNews()) {
        if (const auto *plan = std::get_if<PlannedFormat>(&news)) {
            print(lineOf(*plan));
            continue;
        }
        const PluginKey &key = std::get<PluginKey>(news);
        const ProbeAccount *const probe = account.find(key);
        if (probe && m_filter.fits(key.format, probe->status))
            print(lineOf(key, *probe));
    }
}

void JsonLines::print(const QJsonObject &line)
{
    if (!m_isAskedFor || m_isBroken)
        return;
    const QByteArray text = QJsonDocument(line).toJson(QJsonDocument::Compact) + '\n';
    m_isBroken = !Terminal::printData(QString::fromUtf8(text));
}
