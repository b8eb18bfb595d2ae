#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"

#include "Core/BaseLib/Log/DebugLog.h"

#include <QFile>
#include <QJsonDocument>
#include <QJsonObject>

#include <cmath>

namespace {

constexpr const char *kStageNames[] = {"load", "start", "ask", "close"};

QJsonObject identity(const char *format, const QString &path, quint32 subId)
{
    QJsonObject line{{QStringLiteral("format"), QLatin1String(format)}, {QStringLiteral("path"), path}};
    if (subId != 0)
        line.insert(QStringLiteral("subId"), static_cast<qint64>(subId));
    return line;
}

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

void ProbeReport::write(const char *event, QJsonObject line)
{
    if (!m_file)
        return;
    line.insert(QStringLiteral("event"), QLatin1String(event));
    m_file->write(QJsonDocument(line).toJson(QJsonDocument::Compact) + '\n');
}

void ProbeReport::plan(const char *format, std::size_t files, std::size_t probes)
{
    write("plan", {{QStringLiteral("format"), QLatin1String(format)},
                   {QStringLiteral("files"), static_cast<qint64>(files)},
                   {QStringLiteral("probes"), static_cast<qint64>(probes)}});
}

void ProbeReport::skipped(const char *format, const QString &path, const QString &reason)
{
    if (!m_file)
        return;
    QJsonObject line = identity(format, path, 0);
    line.insert(QStringLiteral("reason"), reason);
    write("skipped", line);
}

void ProbeReport::cancelled() { m_complete = false; }

void ProbeReport::unwritten(const QString &path, const QString &reason)
{
    m_complete = false;
    write("unwritten", {{QStringLiteral("path"), path}, {QStringLiteral("reason"), reason}});
}

void ProbeReport::busy() { write("busy", {}); }

void ProbeReport::finish() { write(m_complete ? "finished" : "ended", {}); }

ProbeEntry::ProbeEntry(const char *format, const EffectRecord &plugin)
    : m_format(format)
    , m_path(plugin.path)
    , m_subId(plugin.subId)
    , m_outer(ProbeReport::instance().m_current)
{
    ProbeReport &report = ProbeReport::instance();
    report.m_current = this;
    if (!report.isOpen())
        return;
    QJsonObject line = identity(m_format, m_path, m_subId);
    if (m_subId != 0)
        line.insert(QStringLiteral("subName"), plugin.subName);
    report.write("begin", line);
    m_timer.start();
}

ProbeEntry::~ProbeEntry()
{
    ProbeReport &report = ProbeReport::instance();
    report.m_current = m_outer;
    if (!report.isOpen())
        return;
    QJsonObject line = identity(m_format, m_path, m_subId);
    line.insert(QStringLiteral("milliseconds"),
                std::round(static_cast<double>(m_timer.nsecsElapsed()) / 1000.0) / 1000.0);
    line.insert(QStringLiteral("records"), static_cast<qint64>(m_records));
    if (m_noPlugin)
        line.insert(QStringLiteral("noPlugin"), true);
    if (!m_reason.isEmpty())
        line.insert(QStringLiteral("reason"), m_reason);
    report.write("end", line);
}

void ProbeReport::reason(const QString &text)
{
    ProbeEntry *entry = instance().m_current;
    if (entry && entry->m_reason.isEmpty())
        entry->m_reason =
            QString(text).remove(entry->m_path + QLatin1String(": ")); // the path stands beside it
}

void ProbeReport::stage(ProbeStage stage)
{
    ProbeReport &report = instance();
    if (!report.m_current || !report.isOpen())
        return;
    const auto index = static_cast<std::size_t>(stage);
    report.write("stage", {{QStringLiteral("stage"), QLatin1String(kStageNames[index])}});
}
