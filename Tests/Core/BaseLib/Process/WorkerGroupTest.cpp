#include "Core/BaseLib/Process/WorkerGroup.h"
#include "Core/BaseLib/Process/ThreadCount.h"
#include "Tests/Support/QtPrinters.h"

#include <QDeadlineTimer>

#include <gtest/gtest.h>

namespace {

constexpr int kPatience = 30000; ///< ms

/// A group with one worker, and all that came from it.
class OneWorker {
public:
    explicit OneWorker(const char *way)
        : m_group(QStringLiteral(WORKER_STAND_IN), {QString::fromLatin1(way)})
    {
        QString reason;
        // NOTE: Wine 8 at times starts no process on a busy machine, but does when it is asked again.
        for (int attempt = 0; attempt < 3 && number == 0; ++attempt)
            number = m_group.start(reason).value_or(0);
        EXPECT_NE(number, 0) << reason.toStdString();
    }

    template <typename Condition>
    bool waitUntil(Condition condition)
    {
        const QDeadlineTimer deadline(kPatience);
        while (!condition() && !deadline.hasExpired())
            for (const WorkerEvent &event : m_group.wait(std::chrono::milliseconds(20))) {
                EXPECT_EQ(event.worker, number);
                EXPECT_FALSE(end) << "something came after the end";
                data += event.data;
                if (event.end)
                    end = event.end;
            }
        return condition();
    }
    bool waitForEnd()
    {
        return waitUntil([this] { return end.has_value(); });
    }

    WorkerGroup &group() { return m_group; }

    int number = 0;
    QByteArray data;
    std::optional<WorkerEnd> end;

private:
    WorkerGroup m_group;
};

} // namespace

TEST(WorkerGroup, BytesGoBothWaysHoweverManyAndAnExitCodeComesLast)
{
    OneWorker worker("echo");
    QByteArray sent;
    for (int size : {1, 5000, 3000000}) { // far more than a pipe holds: nobody may wait for the other
        const QByteArray bytes(size, static_cast<char>('a' + sent.size() % 26));
        sent += bytes;
        EXPECT_TRUE(worker.group().send(worker.number, bytes));
    }
    EXPECT_TRUE(worker.waitUntil([&] { return worker.data.size() >= sent.size(); }));
    EXPECT_TRUE(worker.data == sent) << worker.data.size() << " bytes of " << sent.size();
    EXPECT_GT(worker.group().use(worker.number).memory, 100000);

    EXPECT_TRUE(worker.group().send(worker.number, "leave"));
    ASSERT_TRUE(worker.waitForEnd());
    EXPECT_FALSE(worker.end->crashed);
    EXPECT_EQ(worker.end->code, 7);
    EXPECT_EQ(worker.group().output(worker.number), QStringLiteral("echo: input empty"));
    EXPECT_FALSE(worker.group().send(worker.number, "x"));
    EXPECT_EQ(worker.group().use(worker.number).memory, 0);
}

TEST(WorkerGroup, CrashesAreToldInWordsAndAClosedChannelIsAnEnd)
{
    const struct {
        const char *way, *text, *data;
    } rows[] = {{"crash", "llegal instruction", ""}, {"close", "", "closing\n"}};
    for (const auto &row : rows) {
        OneWorker worker(row.way);
        ASSERT_TRUE(worker.waitForEnd()) << row.way;
        EXPECT_TRUE(worker.end->crashed) << row.way;
        EXPECT_TRUE(worker.end->text.contains(QLatin1String(row.text))) << worker.end->text.toStdString();
        EXPECT_EQ(worker.data, row.data);
        EXPECT_EQ(worker.group().output(worker.number),
                  QLatin1String(row.way) + QStringLiteral(": input empty"));
    }
}

TEST(WorkerGroup, WhatAWorkerStartedEndsWithIt)
{
    for (const char *way : {"child", "detached"})
        for (const bool endsTheGroup : {false, true}) {
            auto worker = std::make_unique<OneWorker>(way);
            ASSERT_TRUE(worker->waitUntil([&] { return worker->data.endsWith('\n'); })) << way;
            const qint64 child = worker->data.trimmed().toLongLong();
            ASSERT_TRUE(isProcessRunning(child)) << way;
            if (endsTheGroup) {
                worker.reset();
            } else {
                worker->group().end(worker->number);
                ASSERT_TRUE(worker->waitForEnd()) << way;
                EXPECT_TRUE(worker->end->crashed) << way;
                worker->waitUntil([child] { return !isProcessRunning(child); });
            }
            EXPECT_FALSE(isProcessRunning(child)) << way << (endsTheGroup ? ", end of the group" : "");
        }
}

TEST(WorkerGroup, AProgramThatIsNotThereGivesTheReason)
{
    WorkerGroup group(QStringLiteral(WORKER_STAND_IN ".not-there"), {});
    QString reason;
    EXPECT_FALSE(group.start(reason));
    EXPECT_FALSE(reason.isEmpty());
    EXPECT_TRUE(group.wait(std::chrono::milliseconds(0)).empty());
}
