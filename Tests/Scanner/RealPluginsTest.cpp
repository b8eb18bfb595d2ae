#include "Tests/Support/RealPlugins.h"
#include "Tests/Support/ScanBench.h"
#include "Tests/Support/VST2Fixture.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QProcess>
#include <QRegularExpression>

using RealPlugins = ScanBench;

TEST_F(RealPlugins, AreFoundOnceAndThenKnown)
{
    const QString folder = realPlugins(m_folder);
    if (folder.isEmpty())
        GTEST_SKIP() << "Debian's zam-plugins and dpf-plugins-vst are not installed";
    m_folder.writeScanList({folder + "/vst", folder + "/vst3"});
    const std::map<QString, QString> environment = {{"FXPROBE_TRACE", "1"},
                                                    {"LSAN_OPTIONS", "detect_leaks=0"}}; // theirs
    const ScannerOutcome first = scanOnce(environment);
    EXPECT_TRUE(first.succeeded()) << qPrintable(first.log);
    const QStringList vst2 = recordsOf("FXConfiguration.xml", "Name Vendor Width Category Enabled Working");
    const QStringList vst3 = recordsOf("VST3Configuration.xml", "Name Vendor Inputs Enabled Working");
    EXPECT_GE(vst2.size(), QDir(folder + "/vst").entryList({"*" + vst2Ending()}).size());
    EXPECT_EQ(vst3.size(), QDir(folder + "/vst3").entryList({"*.vst3"}).size());
    EXPECT_EQ(QStringList(vst2).removeDuplicates(), 0);
    // As their sources state them; where they are built for another system, only some are there.
    const QStringList known = {"ZamComp|Damien Zammit|1|1",          "ZamVerb|Damien Zammit|2|1",
                               "3 Band Splitter|DISTRHO|6|1",        "MVerb|Martin Eastwood, falkTX|2|1",
                               "Nekobi-vst|Sean Bolton, falkTX|1|2", "Cycle Shifter|ndc Plugs|1|1",
                               "ZamGrains|Damien Zammit|1|1",        "Kars-vst|falkTX|1|2"};
    int met = 0;
    for (const QString &row : vst2 + vst3) {
        EXPECT_TRUE(row.endsWith("|1|1")) << qPrintable(row);
        for (const QString &one : known.filter(QRegularExpression('^' + row.section('|', 0, 0) + "\\|"))) {
            EXPECT_TRUE(one.startsWith(row.section('|', 0, -3))) << qPrintable(row);
            ++met;
        }
    }
    EXPECT_GE(met, 3);
    EXPECT_GE(first.log.count("Probing "), vst2.size() + vst3.size());
    EXPECT_EQ(scanOnce(environment).log.count("Probing "), 0);
}

TEST_F(RealPlugins, OfClapAreListedAsAListerOfItsOwnListsThem)
{
    const QDir built(QStringLiteral(FXPROBE_CLAP_PLUGINS));
    QStringList files;
    for (const QFileInfo &file : built.entryInfoList({"*.clap"}, QDir::Files))
        files << file.filePath();
    if (built.dirName().isEmpty() || files.isEmpty())
        GTEST_SKIP() << "Debian's dpf-plugins are not built as CLAP";
    QProcess lister;
    lister.start(FXPROBE_CLAP_LISTER, files);
    EXPECT_TRUE(lister.waitForFinished() && lister.exitCode() == 0);
    QStringList rows =
        QString::fromUtf8(lister.readAllStandardOutput()).remove('\r').split('\n', Qt::SkipEmptyParts);
    EXPECT_GE(rows.size(), files.size());
    // Some state another one's identifier, which a catalogue holds once: they are scanned apart.
    for (int round = 0; !rows.isEmpty(); ++round) {
        std::map<QString, QString> byId;
        for (const QString &row : rows)
            byId.emplace(row.section('|', 1, 1), row);
        const QString folder = m_folder.path(QStringLiteral("Round %1").arg(round));
        QDir().mkpath(folder);
        QStringList expected;
        for (const auto &[id, row] : byId) {
            const QFileInfo file(row.section('|', 0, 0));
            rows.removeOne(row);
            EXPECT_TRUE(QFile::copy(file.filePath(), folder + '/' + file.fileName()));
            expected << folder + '/' + file.fileName() + '|' + row.section('|', 1) + "|1|1";
        }
        m_folder.writeScanList({folder});
        scanOnce({{"LSAN_OPTIONS", "detect_leaks=0"}}); // theirs
        EXPECT_EQ(
            recordsOf("CLAPConfiguration.xml", "Path ID Name Vendor Features Inputs Outputs Enabled Working"),
            expected);
    }
}
