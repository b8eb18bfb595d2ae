#pragma once

#include "Main/AudioEngineController/Effects/Protocol/Probe.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestFolder.h"

#include <QRegularExpression>

#include <gtest/gtest.h>

#include <thread>

/// Notes what it hears of a probe, a word or two for each.
struct NotingObserver final : IProbeObserver {
    static const char *nameOf(ProbeStage stage)
    {
        const char *const names[] = {"load", "start", "ask", "close"};
        return names[static_cast<int>(stage)];
    }
    void stageEntered(ProbeStage stage) override { heard << nameOf(stage); }
    void classBegins(const QString &name) override { heard << name; }
    void classAnnounced() override { heard << "!"; }
    void childrenFound(std::size_t count) override { heard << QString::number(count); }
    void childBegins(const EffectRecord &child) override { heard << '<' + child.subName; }
    void childEnds(const ProbeOutcome &outcome) override
    {
        EXPECT_EQ(outcome.records.size(), 1u);
        EXPECT_EQ(outcome.records[0].working, outcome.status == ProbeStatus::Listed);
        heard << '>' + outcome.reason;
    }
    void childCloses(const EffectRecord &child) override { heard << '(' + child.subName; }
    void childClosed() override { heard << ")"; }

    QStringList heard;
};

/// A table's lines, each as its cells between "~".
inline std::vector<QStringList> rowsOf(const char *table)
{
    std::vector<QStringList> rows;
    for (const QString &line : QString::fromUtf8(table).split('\n', Qt::SkipEmptyParts)) {
        rows.emplace_back();
        for (const QString &cell : line.split('~'))
            rows.back() << cell.trimmed();
    }
    return rows;
}
/// The script in a cell, whose lines are between " / ".
inline QByteArray scriptIn(QString cell) { return cell.replace(" / ", "\n").toUtf8() + '\n'; }

/// Scripted plug-ins that the test itself probes and uses. Their calls are in a trace.
class PluginBench : public testing::Test {
protected:
    /// With the first thread the thread sanitizer starts one of its own, which would count as the plug-in's.
    static void SetUpTestSuite()
    {
        std::thread([] {}).join();
    }

    /// The script's first statement.
    QByteArray tracing() const { return "trace \"" + m_folder.path("trace").toUtf8() + "\"\n"; }
    /// The calls since the last time.
    QString takeTrace() const
    {
        const QStringList lines = m_folder.lines("trace");
        m_folder.write("trace", {});
        return lines.join("; ");
    }
    ProbeOutcome probe(IPluginProbe &&format, const QString &path, const std::set<quint32> &leftOut = {})
    {
        m_observer.heard.clear();
        m_folder.write("trace", {});
        return format.run({PluginFormat::Unknown, path, "its time", leftOut, false}, m_observer);
    }
    /// The outcome's stage must be the last one, or that of the failure, after which a module is only closed.
    void expectStage(const ProbeOutcome &outcome) const
    {
        const QRegularExpression stage(outcome.reason.isEmpty() ? "^(load|start|ask|close)$"
                                                                : "^(load|start|ask)$");
        const QStringList entered = QStringList("load") + m_observer.heard.filter(stage);
        EXPECT_EQ(NotingObserver::nameOf(outcome.stage), entered.last());
    }
    /// The outcome must be what a row says: of the file in row 0 the observer hears row 2; row 3 has the
    /// plug-ins listed, or what becomes of the catalogue, and the reason.
    void expectOutcome(const ProbeOutcome &outcome, const QStringList &row, const char *ending) const
    {
        EXPECT_EQ(m_observer.heard.join(' '), row[2]);
        QStringList listed;
        for (const EffectRecord &record : outcome.records) {
            listed << record.name;
            EXPECT_EQ(record.path + record.fileTime, m_folder.plugins() + '/' + row[0] + ending + "its time");
        }
        EXPECT_EQ(outcome.status, listed.isEmpty() ? ProbeStatus::Failed : ProbeStatus::Listed);
        if (listed.isEmpty())
            listed << (outcome.ifFailed == ProbeOutcome::IfFailed::Record ? "record" : "keep");
        expectStage(outcome);
        listed << (outcome.leftThreads ? "left threads: " : ": ") + outcome.reason;
        EXPECT_EQ(listed.join(' ').replace(" : ", ": ").trimmed(), row[3]);
    }

    TestFolder m_folder;
    const CapturedLog m_log;
    NotingObserver m_observer;
};
