#include "Tests/Main/AudioEngineController/Effects/VST3/BrokenModules.h"
#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QDir>
#include <QFileInfo>

namespace {

class VST3Failures : public VST3ScanBench {
protected:
    void addBroken(const BrokenModule &broken) const
    {
        if (!broken.isBundle) {
            addRaw(broken.name, broken.content);
            return;
        }
        const QString folder = QFileInfo(vst3BundleBinary(modulePath(broken.name))).path();
        EXPECT_TRUE(QDir().mkpath(folder));
        for (const QString &binary : broken.binaries)
            m_folder.write(folder + '/' + binary, m_folder.read(vst3FixturePath()));
    }
};

} // namespace

TEST_F(VST3Failures, FilesThatFailAreRecordedOnceWithTheirReasonInTheLog)
{
    const struct {
        const char *name, *script, *reason;
    } cases[] = {
        {"entry refuses", "class A\nanswer module-entry false\n", "reports that it could not start"},
        {"no class", "", "it lists no audio plug-in among its 0 classes"},
        {"all classes fail", "class A\nclass B\nanswer initialize false\n", "could not be initialised"},
        {"no audio class", "class A\ncategory Other\n", "it lists no audio plug-in among its 1 classes"},
    };
    QStringList expected, reasons;
    for (const auto &row : cases) {
        add(row.name, row.script);
        expected.append(row.name);
        reasons.append(row.reason);
    }
    for (const BrokenModule &broken : brokenModules(m_folder.read(vst3FixturePath()))) {
        addBroken(broken);
        expected.append(broken.name);
        reasons.append(broken.reason);
    }
    // Nothing is known of them but that they do not work.
    for (QString &name : expected)
        name += '|' + name + "|1|0|0|-1|-1";
    expected.sort();
    add("z healthy", "class z\nid 0000000000000000000000000000000A\n");
    expected.append("z|0000000000000000000000000000000A|1|1|0|2|2");
    const ScannerOutcome outcome = scan();
    for (const QString &reason : reasons)
        EXPECT_TRUE(outcome.log.contains(reason)) << qPrintable(reason + '\n' + outcome.log);
    EXPECT_EQ(sortedRecords("Name ID Enabled Working Favourite Inputs Outputs"), expected);
    expectSettled();
}

TEST_F(VST3Failures, ModulesWithoutAFactoryAreNotRecordedAndTriedEachTime)
{
    add("Null factory", "answer get-factory null\n");
    add("No interface", "generation 0\n");
    add("No export", {}, VST3Fixture::NoEntry);
    add("Healthy");
    for (int run = 0; run < 2; ++run) {
        const ScannerOutcome outcome = scan();
        EXPECT_EQ(records("Name"), texts({"Healthy"}));
        EXPECT_EQ(outcome.log.count("VST3 Exception: Failed to get factory function"), 3);
        EXPECT_EQ(loaded(), run == 0 ? texts({"Healthy", "No interface", "Null factory"})
                                     : texts({"No interface", "Null factory"}));
    }
}

TEST_F(VST3Failures, FailingFilesOfOneNameInTwoFolders)
{
    addRaw("a/Same", "no module");
    const QString second = addRaw("b/Same", "no module");
    scan();
    EXPECT_EQ(records("Name ID Working"), QStringList({"Same|" + second + "|0", "Same|Same|0"}));
    expectSettled();
}

TEST_F(VST3Failures, WaveShellsWithoutClassesAreTriedAgain)
{
    add("WaveShell1-VST3 9.2", "");
    addRaw("WaveShell2-VST3 9.2", "no module");
    add("Full WaveShell");
    for (int run = 0; run < 2; ++run) {
        EXPECT_TRUE(scan().log.contains(modulePath("WaveShell2-VST3 9.2") + ": it could not be loaded: "));
        EXPECT_EQ(records("Name Working"), texts({"Full WaveShell|1"}));
        EXPECT_TRUE(loaded().contains("WaveShell1-VST3 9.2"));
        EXPECT_EQ(loaded().contains("Full WaveShell"), run == 0);
    }
}
