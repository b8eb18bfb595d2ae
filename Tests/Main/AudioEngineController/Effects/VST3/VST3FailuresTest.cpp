#include "Tests/Main/AudioEngineController/Effects/VST3/BrokenModules.h"
#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

namespace {

QByteArray moduleBytes()
{
    QFile module(vst3FixturePath());
    EXPECT_TRUE(module.open(QIODevice::ReadOnly));
    return module.readAll();
}

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
            EXPECT_TRUE(QFile::copy(vst3FixturePath(), folder + QLatin1Char('/') + binary));
    }
};

/// As the catalogue has a module of which nothing is known but that it does not work.
QString failedRecord(const QString &name)
{
    return name + QLatin1Char('|') + name + QStringLiteral("|1|0|0|-1|-1");
}

} // namespace

TEST_F(VST3Failures, FilesThatFailAreRecordedOnceWithTheirReasonInTheLog)
{
    const struct {
        const char *name;
        const char *script;
        const char *reason;
    } cases[] = {
        {"entry refuses", "class A\nanswer module-entry false\n", "reports that it could not start"},
        {"no class", "", "No audio class could be listed, of 0 classes"},
        {"all classes fail", "class A\nclass B\nanswer initialize false\n", "could not be initialised"},
        {"no audio class", "class A\ncategory Other\n", "No audio class could be listed, of 1 classes"},
    };
    QStringList expected;
    QStringList reasons;
    for (const auto &row : cases) {
        add(QString::fromLatin1(row.name), row.script);
        expected.append(failedRecord(QString::fromLatin1(row.name)));
        reasons.append(QString::fromLatin1(row.reason));
    }
    for (const BrokenModule &broken : brokenModules(moduleBytes())) {
        addBroken(broken);
        expected.append(failedRecord(broken.name));
        reasons.append(broken.reason);
    }
    add(QStringLiteral("z healthy"));
    expected.sort();
    expected.append(QStringLiteral("z healthy"));
    const ScannerOutcome outcome = scan();
    for (const QString &reason : reasons)
        EXPECT_TRUE(outcome.log.contains(reason)) << qPrintable(reason + QLatin1Char('\n') + outcome.log);
    QStringList found = sortedRecords("Name ID Enabled Working Favourite Inputs Outputs");
    found.last() = found.last().section(QLatin1Char('|'), 0, 0);
    EXPECT_EQ(found, expected);
    const QByteArray catalogue = m_folder.catalogue();
    EXPECT_FALSE(scan().log.contains(QStringLiteral("Cannot load")));
    EXPECT_EQ(loaded(), QStringList());
    EXPECT_EQ(m_folder.catalogue(), catalogue);
}

TEST_F(VST3Failures, ModulesWithoutAFactoryAreNotRecordedAndTriedEachTime)
{
    add(QStringLiteral("Null factory"), "answer get-factory null\n");
    add(QStringLiteral("No interface"), "generation 0\n");
    add(QStringLiteral("No export"), {}, VST3Fixture::NoEntry);
    add(QStringLiteral("Healthy"));
    for (int run = 0; run < 2; ++run) {
        const ScannerOutcome outcome = scan();
        EXPECT_EQ(records("Name"), texts({"Healthy"}));
        EXPECT_EQ(outcome.log.count(QStringLiteral("VST3 Exception: Failed to get factory function")), 3);
        EXPECT_EQ(loaded(), run == 0 ? texts({"Healthy", "No interface", "Null factory"})
                                     : texts({"No interface", "Null factory"}));
    }
}

TEST_F(VST3Failures, FailingFilesOfOneNameInTwoFolders)
{
    addRaw(QStringLiteral("a/Same"), "no module");
    const QByteArray second = addRaw(QStringLiteral("b/Same"), "no module").toUtf8();
    scan();
    const QStringList expected = texts({("Same|" + second + "|0").constData(), "Same|Same|0"});
    EXPECT_EQ(records("Name ID Working"), expected);
    EXPECT_FALSE(scan().log.contains(QStringLiteral("Cannot load")));
    EXPECT_EQ(records("Name ID Working"), expected);
}

TEST_F(VST3Failures, WaveShellsWithoutClassesAreTriedAgain)
{
    add(QStringLiteral("WaveShell1-VST3 9.2"), "");
    addRaw(QStringLiteral("WaveShell2-VST3 9.2"), "no module");
    add(QStringLiteral("Full WaveShell"));
    for (int run = 0; run < 2; ++run) {
        EXPECT_TRUE(scan().log.contains(QStringLiteral("Cannot load the module ") +
                                        modulePath(QStringLiteral("WaveShell2-VST3 9.2"))));
        EXPECT_EQ(records("Name Working"), texts({"Full WaveShell|1"}));
        EXPECT_TRUE(loaded().contains(QStringLiteral("WaveShell1-VST3 9.2")));
        EXPECT_EQ(loaded().contains(QStringLiteral("Full WaveShell")), run == 0);
    }
}
