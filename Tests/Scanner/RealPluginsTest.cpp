#include "Tests/Support/RealPlugins.h"
#include "Tests/Support/ScanBench.h"
#include "Tests/Support/VST2Fixture.h"

#include <QDir>
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
