#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"
#include "Main/AudioEngineController/Effects/Protocol/ReportLines.h"

#include <QDateTime>
#include <QFile>
#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>
#include <cmath>

namespace {

using namespace ReportWord;

QJsonObject identity(PluginFormat format, const QString &path, quint32 subId)
{
    QJsonObject line{{QLatin1String(kFormat), QLatin1String(formatInfo(format).key)},
                     {QLatin1String(kPath), path}};
    if (subId != 0)
        line.insert(QLatin1String(kSubId), static_cast<qint64>(subId));
    return line;
}

QJsonObject withWorker(QJsonObject line, int worker)
{
    if (worker != 0)
        line.insert(QLatin1String(kWorker), worker);
    return line;
}

/// To a thousandth.
double rounded(double milliseconds) { return std::round(milliseconds * 1000.0) / 1000.0; }

} // namespace

ProbeReport &ProbeReport::instance()
{
    static ProbeReport report;
    return report;
}

ProbeReport::~ProbeReport() = default;

FileResult ProbeReport::open(const QString &path)
{
    auto file = std::make_unique<QFile>(path);
    if (!file->open(QIODevice::WriteOnly | QIODevice::Append | QIODevice::Unbuffered))
        return {file->errorString()};
    m_file = std::move(file);
    m_opened = QDateTime::currentMSecsSinceEpoch();
    m_sinceOpened.start();
    m_complete = true;
    write("start", {});
    return {};
}

void ProbeReport::openFromEnvironment()
{
    const QString path = qEnvironmentVariable("FXPROBE_REPORT");
    if (path.isEmpty())
        return;
    if (const FileResult opened = open(path); !opened)
        DebugLog(L"Cannot write the report %ls: %ls", path, opened.reason);
}

/// Milliseconds since 1970 (UTC), by a clock that nobody sets while the report is written.
double ProbeReport::now() const
{
    constexpr double kPerMillisecond = 1e6; // ns
    return rounded(static_cast<double>(m_opened) +
                   static_cast<double>(m_sinceOpened.nsecsElapsed()) / kPerMillisecond);
}

void ProbeReport::write(const char *event, QJsonObject line)
{
    if (!m_file)
        return;
    line.insert(QLatin1String(kEvent), QLatin1String(event));
    line.insert(QLatin1String(kTime), now());
    m_file->write(QJsonDocument(line).toJson(QJsonDocument::Compact) + '\n');
}

void ProbeReport::plan(PluginFormat format, std::size_t files, std::size_t probes)
{
    write("plan", {{QLatin1String(kFormat), QLatin1String(formatInfo(format).key)},
                   {QLatin1String(kFiles), static_cast<qint64>(files)},
                   {QLatin1String(kProbes), static_cast<qint64>(probes)}});
}

void ProbeReport::begin(PluginFormat format, const EffectRecord &plugin, int worker)
{
    if (!m_file)
        return;
    QJsonObject line = identity(format, plugin.path, plugin.subId);
    if (plugin.subId != 0)
        line.insert(QLatin1String(kSubName), plugin.subName);
    write("begin", withWorker(line, worker));
}

void ProbeReport::stage(ProbeStage stage, int worker)
{
    if (m_file)
        write("stage",
              withWorker({{QLatin1String(kStage), QLatin1String(kStages[static_cast<std::size_t>(stage)])}},
                         worker));
}

void ProbeReport::end(PluginFormat format, const EffectRecord &plugin, const ProbeOutcome &outcome,
                      int worker)
{
    if (!m_file)
        return;
    QJsonObject line = identity(format, plugin.path, plugin.subId);
    const auto works = [](const EffectRecord &record) { return record.working; };
    line.insert(QLatin1String(kMilliseconds), rounded(outcome.milliseconds));
    line.insert(QLatin1String(kRecords),
                static_cast<qint64>(std::count_if(outcome.records.begin(), outcome.records.end(), works)));
    line.insert(QLatin1String(kStatus), QLatin1String(statusText(outcome.status)));
    if (!outcome.reason.isEmpty())
        line.insert(QLatin1String(kReason), outcome.reason);
    write("end", withWorker(line, worker));
}

void ProbeReport::workerEnded(int worker, const QString &reason)
{
    if (m_file)
        write("workerEnd", withWorker({{QLatin1String(kReason), reason}}, worker));
}

void ProbeReport::skipped(PluginFormat format, const QString &path, const QString &reason)
{
    if (!m_file)
        return;
    QJsonObject line = identity(format, path, 0);
    line.insert(QLatin1String(kReason), reason);
    write("skipped", line);
}

void ProbeReport::cancelled() { m_complete = false; }

void ProbeReport::unwritten(const QString &path, const QString &reason)
{
    m_complete = false;
    write("unwritten", {{QLatin1String(kPath), path}, {QLatin1String(kReason), reason}});
}

void ProbeReport::unreadList(const QString &path, const QString &reason)
{
    m_complete = false;
    write("unreadList", {{QLatin1String(kPath), path}, {QLatin1String(kReason), reason}});
}

void ProbeReport::looking(const QString &path) { write("looking", {{QLatin1String(kPath), path}}); }

void ProbeReport::unsearched(const QString &path, const QString &reason)
{
    write("unsearched", {{QLatin1String(kPath), path}, {QLatin1String(kReason), reason}});
}

void ProbeReport::busy() { write("busy", {}); }

void ProbeReport::finish() { write(m_complete ? "finished" : "ended", {}); }
