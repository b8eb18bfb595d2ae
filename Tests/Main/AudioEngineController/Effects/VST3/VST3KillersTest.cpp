#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

namespace {

class VST3Killers : public VST3ScanBench {
protected:
    /// A module of two classes that ends the process at a stage.
    void addKiller(const QByteArray &name, const char *stage, const char *kind) const
    {
        add(QString::fromLatin1(name), QByteArray("fault ") + stage + ' ' + kind + "\nclass \"" + name +
                                           " A\"\nclass \"" + name + " B\"\n");
    }
};

} // namespace

/// Modules in the order in which they are probed, K for one that kills.
class VST3KillerOrder : public VST3Killers, public testing::WithParamInterface<const char *> {};

TEST_P(VST3KillerOrder, NeedsOneRunMoreThanThereAreKillers)
{
    const char *stages[] = {"static-destructor", "initialize", "static-constructor", "module-exit"};
    const QByteArray order = GetParam();
    QStringList expected;
    for (int place = 0; place < order.size(); ++place) {
        const QByteArray name = QByteArray(1, static_cast<char>('a' + place)) + " Comp";
        const bool kills = order[place] == 'K';
        if (kills)
            addKiller(name, stages[place], "kill");
        else
            add(QString::fromLatin1(name));
        expected.append(QString::fromLatin1(name) + QLatin1String(kills ? "|0|0" : "|1|1"));
    }
    EXPECT_EQ(scanUntilSettled(), order.count('K') + 1);
    EXPECT_EQ(sortedRecords("Name Enabled Working"), expected);
    // Found once and for all, also when the file changes.
    const char first = static_cast<char>('a' + order.indexOf('K'));
    update(QLatin1Char(first) + QStringLiteral(" Comp"), "class Mended\n");
    scan();
    EXPECT_EQ(loaded(), QStringList());
    EXPECT_EQ(sortedRecords("Name Enabled Working"), expected);
}

INSTANTIATE_TEST_SUITE_P(Order, VST3KillerOrder,
                         testing::Values("KHHH", "HHHK", "KKHH", "HHKK", "KHKH", "HKKH", "KKKK"),
                         [](const auto &row) { return std::string(row.param); });

TEST_F(VST3Killers, CrashesOfKnownPluginsKeepTheUsersMarks)
{
    add(QStringLiteral("Comp"), "class First\nid 0000000000000000000000000000000A\n"
                                "class Second\nid 0000000000000000000000000000000B\n");
    add(QStringLiteral("Other"), "class Other\nid 0000000000000000000000000000000C\n");
    scan();
    for (const char *name : {"First", "Second"}) {
        mark(QLatin1String(name), "Favourite", "1");
        mark(QLatin1String(name), "CategoryMask", "16384");
    }
    update(QStringLiteral("Comp"), "class First\nfault initialize segv\n");
    scanOnce();
    EXPECT_EQ(m_folder.markers(), texts({"Comp.scan3"}));
    const QStringList expected =
        texts({"Second|0000000000000000000000000000000B|2021-03-04 05:06|16384|1|1|1",
               "Other|0000000000000000000000000000000C|2021-03-04 05:06|0|0|1|1",
               "First|Comp|2022-03-04 05:06|16384|1|0|0"});
    for (int run = 0; run < 2; ++run) {
        scan();
        EXPECT_EQ(records("Name ID FileTime CategoryMask Favourite Enabled Working"), expected);
        EXPECT_EQ(loaded(), QStringList());
    }
}

TEST_F(VST3Killers, ACulpritWhoseNameAFailedFileHoldsIsKnownByItsPath)
{
    addRaw(QStringLiteral("a/Same"), "no module");
    const QString culprit = add(QStringLiteral("b/Same"), "fault initialize kill\nclass Same\n");
    add(QStringLiteral("c healthy"));
    EXPECT_EQ(scanUntilSettled(), 2);
    const QStringList expected{QStringLiteral("Same|%1|%1|0|0").arg(culprit),
                               QStringLiteral("Same|Same|%1|1|0").arg(modulePath(QStringLiteral("a/Same"))),
                               QStringLiteral("c healthy")};
    QStringList found = sortedRecords("Name ID Path Enabled Working");
    ASSERT_EQ(found.size(), 3);
    found.last() = found.last().section(QLatin1Char('|'), 0, 0);
    EXPECT_EQ(found, expected);
    scan();
    EXPECT_EQ(loaded(), QStringList());
}

TEST_F(VST3Killers, ACrashedWaveShellIsLeftAloneForOneRun)
{
    add(QStringLiteral("WaveShell1"), "class W\nfault initialize kill\n");
    add(QStringLiteral("a Healthy"));
    scanOnce();
    EXPECT_EQ(m_folder.markers(), texts({"WaveShell1.scan3"}));
    scan();
    EXPECT_EQ(loaded(), QStringList());
    EXPECT_EQ(records("Name"), texts({"a Healthy"}));
    scanOnce();
    EXPECT_EQ(loaded(), texts({"WaveShell1"}));
    EXPECT_EQ(m_folder.markers(), texts({"WaveShell1.scan3"}));
    add(QStringLiteral("WaveShell1"), "class W\n");
    scan();
    scan();
    EXPECT_EQ(sortedRecords("Name Enabled Working"), texts({"W|1|1", "a Healthy|1|1"}));
}
