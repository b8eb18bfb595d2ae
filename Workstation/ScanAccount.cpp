#include "Workstation/ScanAccount.h"

#include <QFile>
#include <QFileInfo>
#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>

namespace {

PluginKey keyOf(const QJsonObject &line)
{
    return {line.value(QLatin1String("format")).toString(), line.value(QLatin1String("path")).toString(),
            static_cast<quint32>(line.value(QLatin1String("subId")).toDouble())};
}

/// What a plug-in was doing in a stage of the report.
QString stageText(const QString &stage)
{
    static const std::map<QString, QString> texts{
        {QStringLiteral("load"), QStringLiteral(" while it was being loaded")},
        {QStringLiteral("start"), QStringLiteral(" while it was starting")},
        {QStringLiteral("ask"), QStringLiteral(" while it was asked for its data")},
        {QStringLiteral("close"), QStringLiteral(" while it was being closed and unloaded")}};
    const auto text = texts.find(stage);
    return text == texts.end() ? QString() : text->second;
}

QString blame(const ScannerRunEnd &end, const QString &stage)
{
    const QString when = stageText(stage);
    switch (end.how) {
    case ScannerRunEnd::How::Crashed:
        return QStringLiteral("it crashed the scanner%1: %2").arg(when, end.text);
    case ScannerRunEnd::How::TimeLimit:
        return QStringLiteral("it gave no answer for %1 s%2").arg(end.code).arg(when);
    default:
        return QStringLiteral("it ended the scanner with exit code %1%2").arg(end.code).arg(when);
    }
}

} // namespace

PluginKey pluginKey(const ScanCulprit &culprit)
{
    return {culprit.isVst3 ? QStringLiteral("vst3") : QStringLiteral("vst2"), culprit.plugin.path,
            culprit.plugin.subId};
}

ScanAccount::ScanAccount(const QString &reportFile)
    : m_file(reportFile)
    , m_read(QFileInfo(reportFile).size()) // what others reported before is none of this scan's
{}

void ScanAccount::update()
{
    QFile file(m_file);
    if (!file.open(QIODevice::ReadOnly) || !file.seek(m_read))
        return;
    const QByteArray news = file.readAll();
    m_read += news.size();
    m_rest += news;
    int from = 0;
    for (int end = m_rest.indexOf('\n'); end >= 0; end = m_rest.indexOf('\n', from)) {
        takeLine(m_rest.mid(from, end - from));
        from = end + 1;
    }
    m_rest.remove(0, from);
}

void ScanAccount::takeLine(const QByteArray &text)
{
    const QJsonObject line = QJsonDocument::fromJson(text).object();
    const QString event = line.value(QLatin1String("event")).toString();
    m_finished = event == QLatin1String("finished");
    m_busy = event == QLatin1String("busy");
    if (event == QLatin1String("start")) {
        m_done += static_cast<int>(
            std::count_if(m_open.begin(), m_open.end(), [](const PluginKey &key) { return key.subId == 0; }));
        m_open.clear();
        m_planned = m_done; // what is left of the plan is planned anew
    } else if (event == QLatin1String("plan")) {
        m_planned += line.value(QLatin1String("probes")).toInt();
    } else if (event == QLatin1String("begin")) {
        begin(keyOf(line), line);
    } else if (event == QLatin1String("stage")) {
        if (!m_open.empty())
            m_probes[m_open.back()].stage = line.value(QLatin1String("stage")).toString();
    } else if (event == QLatin1String("end") || event == QLatin1String("skipped")) {
        end(keyOf(line), line);
    } else if (event == QLatin1String("unwritten")) {
        const QString problem = QStringLiteral("%1 could not be written: %2")
                                    .arg(line.value(QLatin1String("path")).toString(),
                                         line.value(QLatin1String("reason")).toString());
        if (!m_problems.contains(problem))
            m_problems.append(problem);
    }
}

void ScanAccount::begin(const PluginKey &key, const QJsonObject &line)
{
    m_open.push_back(key);
    m_begun.push_back(key);
    ProbeAccount account;
    account.subName = line.value(QLatin1String("subName")).toString();
    m_probes[key] = account;
}

void ScanAccount::end(const PluginKey &key, const QJsonObject &line)
{
    const bool isSkipped = line.value(QLatin1String("event")) == QLatin1String("skipped");
    ProbeAccount &account = m_probes[key];
    account.isLoaded = !isSkipped;
    account.noPlugin = isSkipped || line.value(QLatin1String("noPlugin")).toBool();
    account.reason = line.value(QLatin1String("reason")).toString();
    account.records = line.value(QLatin1String("records")).toInt();
    account.milliseconds = line.value(QLatin1String("milliseconds")).toDouble(-1);
    const auto open = std::find(m_open.begin(), m_open.end(), key);
    m_open.erase(open, m_open.end());
    if (key.subId == 0)
        ++m_done;
}

void ScanAccount::scannerEnded(const ScannerRunEnd &end)
{
    update();
    for (const ScanCulprit &culprit : end.culprits) {
        ProbeAccount &account = m_probes[pluginKey(culprit)];
        account.reason = blame(end, account.stage);
        account.records = 0;
    }
}

std::vector<PluginKey> ScanAccount::takeBegun()
{
    std::vector<PluginKey> begun;
    begun.swap(m_begun);
    return begun;
}

QString ScanAccount::reasonOf(const ScanCulprit &culprit) const
{
    const ProbeAccount *account = find(pluginKey(culprit));
    return account ? account->reason : QString();
}

const ProbeAccount *ScanAccount::find(const PluginKey &key) const
{
    const auto found = m_probes.find(key);
    return found == m_probes.end() ? nullptr : &found->second;
}

bool ScanAccount::wasProbed(const QString &format, const QString &path) const
{
    const auto found = m_probes.lower_bound({format, path, 0});
    return found != m_probes.end() && found->first.format == format && found->first.path == path;
}
