#pragma once

#include <QJsonValue>

/// The words of the report that its writer and its reader share; docs/report.md describes them.
namespace ReportWord {
inline constexpr char kEvent[] = "event";
inline constexpr char kFormat[] = "format";
inline constexpr char kPath[] = "path";
inline constexpr char kSubId[] = "subId";
inline constexpr char kSubName[] = "subName";
inline constexpr char kStage[] = "stage";
inline constexpr char kStatus[] = "status";
inline constexpr char kTime[] = "time";
inline constexpr char kWorker[] = "worker";
inline constexpr char kReason[] = "reason";
inline constexpr char kMilliseconds[] = "milliseconds";
inline constexpr char kRecords[] = "records";
inline constexpr char kFiles[] = "files";
inline constexpr char kProbes[] = "probes";

/// In the order of `ReportLine::Event`.
inline constexpr const char *kEvents[] = {"start", "busy",      "plan",      "begin",      "stage",
                                          "end",   "skipped",   "unwritten", "unreadList", "finished",
                                          "ended", "workerEnd", "looking",   "unsearched"};
/// In the order of `ProbeStage`.
inline constexpr const char *kStages[] = {"load", "start", "ask", "close"};

/// A sub-plug-in's identifier; 0 for anything else.
inline quint32 subIdOf(const QJsonValue &value)
{
    const double number = value.toDouble();
    return number > 0 && number <= 4294967295.0 ? static_cast<quint32>(number) : 0;
}
} // namespace ReportWord
