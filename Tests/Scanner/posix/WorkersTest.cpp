#include "Tests/Support/ScanBench.h"

#include <QDir>
#include <QElapsedTimer>
#include <QFile>
#include <QFileInfo>
#include <QRegularExpression>
#include <QSet>
#include <QThread>

#include <cerrno>
#include <csignal>

namespace {

/// A scan with workers, and what they do to each other and to the machine.
class Workers : public ScanBench {
protected:
    const std::map<QString, QString> kPool = {
        {"FXPROBE_JOBS", "3"}, {"FXPROBE_PROBE_LIMIT", "4"}, {"FXPROBE_MEMORY_LIMIT", "400"}};

    /// The workers that run for this test's folder.
    QStringList running() const
    {
        QStringList processes;
        for (const QString &process : QDir("/proc").entryList(QDir::Dirs)) {
            QFile command("/proc/" + process + "/cmdline"), environment("/proc/" + process + "/environ");
            if (command.open(QIODevice::ReadOnly) && command.readAll().contains("-probe_worker") &&
                environment.open(QIODevice::ReadOnly) &&
                environment.readAll().contains(m_folder.dataFolder().toUtf8()))
                processes.append(process);
        }
        return processes;
    }
    /// Ends the scanner by force. What it started must be gone soon after.
    void killAndWatch(ScannerRun &scanner) const
    {
        scanner.kill();
        scanner.wait();
        QElapsedTimer clock;
        clock.start();
        while (!running().isEmpty() && clock.elapsed() < 5000)
            QThread::msleep(10);
        EXPECT_LT(clock.elapsed(), 1000) << qPrintable(running().join(' '));
    }
    /// The reason that is kept of a module; empty where it has none.
    QString reason(const QString &module) const
    {
        for (const QString &line : m_folder.lines("Effects/FXProbes.json"))
            if (line.contains('/' + module + ".vst3\""))
                return line.section("\"reason\":\"", 1).section('"', 0, 0);
        return QString();
    }
};

} // namespace

TEST_F(Workers, KeepToThemselvesWhatPluginsDo)
{
    const QByteArray left = m_folder.path("left").toUtf8();
    const struct {
        const char *name;
        QByteArray script;
        const char *reason; ///< none: it is listed
    } rows[] = {{"Brood", "effect initialize feed 250\neffect initialize feed 250\nfault initialize hang\n",
                 "it took more than 400 MiB of memory"},
                {"Child", "effect initialize fork \"" + left + "\"\n", nullptr},
                {"Closed", "effect initialize close-all 1\n", "it closed the channel of its worker"},
                {"Daemon", "effect initialize daemon \"" + left + "\"\n", nullptr},
                {"Garbage", "effect initialize garbage 1\n", "it wrote into the channel of its worker"},
                {"Greedy", "fault initialize memory\n", "it took more than 400 MiB of memory"},
                {"Input", "effect initialize input 1\n", nullptr},
                {"Late", "effect module-exit late-fault 400\n", nullptr},
                {"Patient", "delay initialize 900\n", nullptr},
                {"Printed", "effect initialize print 1\nfault initialize abort\n", "it gave up (abort)"},
                {"Terminal", "effect initialize terminal 1\n", nullptr}};
    for (const auto &row : rows)
        put(row.name + QString(".vst3"), row.script);
    const ScannerOutcome outcome = scanOnce(kPool);
    EXPECT_TRUE(outcome.succeeded()) << qPrintable(outcome.log);
    EXPECT_EQ(m_folder.markers(), QStringList());
    QStringList expected;
    for (const auto &row : rows) {
        expected.append(row.name + QString(row.reason ? "|0|0" : "|1|1"));
        EXPECT_TRUE(reason(row.name).contains(row.reason ? row.reason : "") &&
                    reason(row.name).isEmpty() == !row.reason)
            << row.name << ": " << qPrintable(reason(row.name));
    }
    EXPECT_EQ(sortedRecords("Name Enabled Working"), expected) << qPrintable(outcome.log);
    EXPECT_EQ(m_folder.lines("left").size(), 2);
    for (const QString &process : m_folder.lines("left"))
        EXPECT_TRUE(::kill(process.toInt(), 0) != 0 && errno == ESRCH) << qPrintable(process);
}

TEST_F(Workers, LeaveWithTheirScannerAndBlameNobody)
{
    QStringList names;
    for (int number = 0; number < 12; ++number) {
        names.append("P" + QString::number(100 + number));
        put(names.last() + ".vst3", "delay initialize 60\n");
    }
    for (int moment = 1; moment < names.size(); moment += 3) {
        SCOPED_TRACE(moment);
        m_folder.write("Effects/VST3Configuration.xml", {});
        ScannerRun scanner(scannerProgram(), m_folder);
        for (const auto &[name, value] : kPool)
            scanner.setEnvironment(name, value);
        forgetTrace();
        ASSERT_TRUE(scanner.start() && scanner.waitUntil([&] { return loaded().size() >= moment; }));
        killAndWatch(scanner);
        EXPECT_TRUE(scanOnce(kPool).succeeded());
        QStringList expected;
        for (const QString &name : names)
            expected.append(name + "|1|1");
        EXPECT_EQ(sortedRecords("Name Enabled Working"), expected);
        EXPECT_EQ(m_folder.markers(), QStringList());
    }
}

TEST_F(Workers, LeaveWithTheirScannerWhateverTheirPluginsDo)
{
    put("P.vst3", "effect create-instance stay 1\nfault initialize hang\n");
    ScannerRun scanner(scannerProgram(), m_folder);
    for (const auto &[name, value] : kPool)
        scanner.setEnvironment(name, value);
    ASSERT_TRUE(scanner.start() && waitForStage(scanner, "P", "initialize"));
    killAndWatch(scanner);
}

TEST_F(Workers, BeginWithTheSuspectsOfEveryFormatOneByOneAndThenWithTheSlowest)
{
    const QString suspects[] = {put("S.vst2"), put("T.vst2", "fault open abort\n")};
    for (const char *name : {"A", "B", "C"})
        put(name + QString(".vst3"), "delay initialize 600\n");
    const QString slow = put("Slow.vst2");
    ASSERT_TRUE(QFile::resize(slow, 20 << 20)); // as a slow one mostly is
    dateFirst(slow);
    for (const QString &suspect : suspects)
        m_folder.write("Effects/" + QFileInfo(suspect).baseName() + ".scan",
                       "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<CrashedPlugin>\n\t<Path>" +
                           suspect.toUtf8() + "</Path>\n\t<Suspect>1</Suspect>\n</CrashedPlugin>\n");
    std::map<QString, QString> environment = kPool;
    environment["FXPROBE_REPORT"] = m_folder.path("report");
    EXPECT_TRUE(scanOnce(environment).succeeded());
    QStringList told;
    QSet<QString> workers;
    for (const QString &line : m_folder.lines("report")) {
        const QString module = line.section("Plugins/", 1).section('.', 0, 0);
        if (line.contains("\"begin\"") || line.contains("\"end\""))
            told.append(line.contains("\"end\"") ? module + '.' : module);
        workers.insert(line.section("\"worker\":", 1));
    }
    workers.remove(QString());
    told.removeDuplicates(); // a culprit may be asked again
    EXPECT_EQ(told.mid(0, 4), QStringList({"S", "S.", "T", "T."}));
    EXPECT_TRUE(told.filter(QRegularExpression("^\\w+$")).mid(2, 3).contains("Slow"))
        << qPrintable(told.join(' '));
    EXPECT_EQ(m_folder.lines("report").filter("\"workerEnd\"").size(), workers.size());
    EXPECT_EQ(m_folder.markers(), QStringList());
}
