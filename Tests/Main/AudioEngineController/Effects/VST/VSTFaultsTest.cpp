#include "Tests/Main/AudioEngineController/Effects/VST/VSTScanBench.h"
#include "Tests/Support/PlatformValues.h"

#include <algorithm>

namespace {

class VSTFaults : public VSTScanBench {
protected:
    /// A killer for each row, named so that its place in the order of the scan is fixed.
    struct Killer {
        const char *name;
        const char *stage;
        const char *kind;
    };
};

constexpr const char *kContained[] = {"segv",           "divide",    "illegal",
                                      "stack-overflow", "throw-std", "throw-int"};
constexpr const char *kGuardedStages[] = {"entry", "get-plug-category", "get-effect-name",
                                          "get-vendor-string", "close"};

} // namespace

TEST_F(VSTFaults, FaultsInGuardedCallsCostTheCallOnly)
{
    int number = 0;
    for (const char *stage : kGuardedStages)
        for (const char *kind : kContained) {
            ++number;
            add(QStringLiteral("%1 %2 %3").arg(number, 2).arg(QLatin1String(stage), QLatin1String(kind)),
                QByteArray("fault ") + stage + ' ' + kind + "\nname \"P" + QByteArray::number(number) +
                    "\"\n");
        }
    add(QStringLiteral("99 healthy"), "name Healthy\n");
    const ScannerOutcome outcome = scan();
    EXPECT_EQ(records("Name").size(), number + 1);
    EXPECT_EQ(sortedRecords("Working").count(QStringLiteral("0")), 6) << "those whose entry point fails";
    EXPECT_TRUE(records("Name Vendor").contains(QStringLiteral("Healthy|Fixture Works")));
    EXPECT_EQ(records("Vendor").count(QString()), 12) << "those, and the ones that fail at their vendor";
    // Two systems, two views of a stack that is used up.
    EXPECT_EQ(outcome.log.count(QStringLiteral("SE Exception: Access Violation")) +
                  outcome.log.count(QStringLiteral("SE Exception: 0xC00000FD")),
              12)
        << qPrintable(outcome.log);
    EXPECT_EQ(outcome.log.count(QStringLiteral("SE Exception: 0xC0000094")), 6);
    EXPECT_EQ(outcome.log.count(QStringLiteral("SE Exception: 0xC000001D")), 6);
    expectSettled();
}

TEST_F(VSTFaults, AfterAFaultNothingIsClosedOrUnloaded)
{
    add(QStringLiteral("Fault"), "fault get-vendor-string segv\n");
    add(QStringLiteral("Throw"), "fault get-vendor-string throw-std\n");
    scan();
    EXPECT_EQ(traceOf(QStringLiteral("Fault")).last(), QStringLiteral("get-vendor-string Fault"));
    EXPECT_EQ(traceOf(QStringLiteral("Throw")).last(), QStringLiteral("static-destructor"));
}

TEST_F(VSTFaults, KillersOfBothFormatsCostOneRunEach)
{
    const Killer killers[] = {
        {"a", "static-constructor", kLoaderKiller},
        {"b", "entry", "abort"},
        {"c", "entry", "_exit"},
        {"d", "get-plug-category", "exit"},
        {"f", "get-effect-name", "kill"},
        {"g", "get-vendor-string", "terminate"},
        {"h", "close", "pthread-exit"},
        {"i", "static-destructor", kLoaderKiller},
        {"k", "static-constructor", "throw-int"},
    };
    QStringList expected;
    for (const Killer &killer : killers) {
        add(QString::fromLatin1(killer.name), QByteArray("fault ") + killer.stage + ' ' + killer.kind + '\n');
        expected.append(QString::fromLatin1(killer.name) + QStringLiteral("|0|0"));
    }
    for (const char *name : {"e healthy", "j healthy", "z healthy"}) {
        add(QString::fromLatin1(name));
        expected.append(QString::fromLatin1(name) + QStringLiteral("|1|1"));
    }
    addVST3(QStringLiteral("a3"), "fault initialize kill\n");
    addVST3(QStringLiteral("b3"), "");
    addVST3(QStringLiteral("c3"), "fault module-exit abort\n");
    EXPECT_EQ(scanUntilSettled(), int(std::size(killers)) + 2 + 1);
    expected.sort();
    EXPECT_EQ(sortedRecords("Name Enabled Working"), expected);
    QStringList vst3 = recordsOf(QStringLiteral("VST3Configuration.xml"), "Path Enabled Working");
    EXPECT_EQ(vst3.filter(QStringLiteral("|0|0")).size(), 2);
    EXPECT_EQ(vst3.filter(QStringLiteral("|1|1")).size(), 1);
    expectSettled();
    // A new version does not bring a killer back.
    update(QStringLiteral("b"));
    expectSettled();
}

TEST_F(VSTFaults, AHangThatIsEndedFromOutsideNamesItsPlugin)
{
    add(QStringLiteral("a healthy"));
    add(QStringLiteral("b hangs"), "fault get-effect-name hang\n");
    add(QStringLiteral("c healthy"));
    ScannerRun run(QStringLiteral(FXPROBE), m_folder);
    ASSERT_TRUE(run.start());
    ASSERT_TRUE(run.waitUntil([this] { return traceOf(QStringLiteral("b hangs")).size() >= 4; }));
    run.kill();
    run.wait();
    EXPECT_EQ(m_folder.markers(), QStringList(QStringLiteral("b hangs.scan")));
    EXPECT_EQ(records("Name"), QStringList(QStringLiteral("a healthy"))) << "found before, written before";
    scan();
    EXPECT_EQ(sortedRecords("Name Enabled"), texts({"a healthy|1", "b hangs|0", "c healthy|1"}));
}
