#include "Tests/Scanner/ScannerTest.h"
#include "Tests/Support/VST2Fixture.h"

#include <QFile>

namespace {

const QDateTime kUsual({2021, 3, 4}, {5, 6});

/// So many characters that a module in it has a path of more than 500.
QString deepFolder() { return (QString(120, 'd') + '/').repeated(4); }

class OddPlugins : public ScannerTest {
protected:
    QString vst2CataloguePath() const { return m_folder.effects() + "/FXConfiguration.xml"; }
    QByteArray catalogues() const
    {
        return m_folder.read(cataloguePath()) + m_folder.read(vst2CataloguePath());
    }
};

} // namespace

// Each in both formats, all in one scan.
TEST_F(OddPlugins, AreListedOrBlamedAsOthersAre)
{
    const struct {
        QString file;
        QDateTime date;
        bool kills;
    } rows[] = {
        {"a/Comp", kUsual, false},
        {"b/comp", kUsual, false}, // differs in nothing but case
        {"c/Straße", kUsual, false},
        {"c/STRASSE", kUsual, false}, // alike in capitals only
        {"c/Start of 1970", QDateTime::fromMSecsSinceEpoch(0), false},
        {"c/Future", QDateTime({2099, 12, 31}, {23, 59}), false},
        {deepFolder() + "Deep", kUsual, false},
        {deepFolder() + "Deadly", kUsual, true},
        {"日本 🎛/音 🎛", kUsual, false},
        {"日本 🎛/致命的 💥", kUsual, true},
    };
    int killers = 0;
    for (const auto &row : rows) {
        const QByteArray number = QByteArray::number(static_cast<int>(&row - rows));
        const QByteArray trace = "trace \"" + tracePath().toUtf8() + "\" " + number + '\n';
        const QByteArray vst3 =
            trace + "class Three" + number + (row.kills ? "\nfault initialize kill\n" : "\n");
        const QByteArray vst2 =
            trace + "name Two" + number + (row.kills ? "\nfault get-vendor-string kill\n" : "\n");
        m_folder.setModified(addVST3File(m_folder.plugins(), row.file, vst3), row.date);
        m_folder.setModified(addVST2File(m_folder.plugins(), row.file, vst2), row.date);
        killers += row.kills ? 2 : 0;
    }
    EXPECT_EQ(static_cast<int>(runUntilSettled(scannerProgram(), m_folder).size()), killers + 1);
    const QByteArray settled = catalogues();
    for (const auto &row : rows) {
        SCOPED_TRACE(qPrintable(row.file));
        const QByteArray number = QByteArray::number(static_cast<int>(&row - rows));
        for (const QByteArray name : {"<Name>Three", "<Name>Two"})
            EXPECT_EQ(settled.contains(name + number + "</Name>"), !row.kills);
    }
    EXPECT_EQ(settled.count("<Enabled>0<"), killers);
    EXPECT_EQ(settled.count("<Working>0<"), killers);
    forgetTrace();
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(trace(), QStringList());
    EXPECT_EQ(catalogues(), settled);
}

// What crashed so gets no record, but is left alone until a run has come to its end.
TEST_F(OddPlugins, CrashedWaveShellsDoNotComeBackInTheNextRun)
{
    for (const char *shell : {"a/WaveShell1-VST3 9.2", "b/WaveShell1-VST3 9.2", "c/WaveShell1-VST3 9.2"})
        addVST3File(m_folder.plugins(), shell, "class Inner\nfault module-entry kill\n");
    for (const char *killer : {"Bad1", "Bad2"})
        addVST2File(m_folder.plugins(), killer, "fault get-vendor-string kill\n");
    addVST3File(m_folder.plugins(), "Good3", "class Good3\n");
    addVST2File(m_folder.plugins(), "Good2", "name Good2\n");
    EXPECT_EQ(runUntilSettled(scannerProgram(), m_folder).size(), 6u);
    for (const char *name : {"<Name>Good3<", "<Name>Good2<", "<Name>Bad1<", "<Name>Bad2<"})
        EXPECT_TRUE(catalogues().contains(name)) << name;
    EXPECT_FALSE(catalogues().contains("WaveShell"));
}

TEST_F(OddPlugins, AFolderThatChangesDuringTheScan)
{
    addModule("A", "delay initialize 500\n");
    for (const char *name : {"B", "C", "D"})
        addModule(QString::fromLatin1(name));
    ScannerRun scanner(scannerProgram(), m_folder);
    ASSERT_TRUE(scanner.start());
    ASSERT_TRUE(waitForStage(scanner, "A", "initialize"));
    EXPECT_TRUE(QFile::remove(m_folder.path("Plugins/B.vst3")));
    m_folder.write("Plugins/C.vst3", "no module");
    addModule("E");
    EXPECT_TRUE(scanner.wait().succeeded());
    EXPECT_EQ(m_folder.markers(), QStringList());
    const auto first = records();
    EXPECT_TRUE(first.at("A").working && first.at("D").working);
    EXPECT_FALSE(first.at("C").working);
    EXPECT_EQ(first.count("E"), 0u) << "came after the folder was read";

    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(listed(), QStringList({"A", "C", "D", "E"}));
}
