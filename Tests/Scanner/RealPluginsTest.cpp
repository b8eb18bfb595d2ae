#include "Tests/Support/RealPlugins.h"
#include "Tests/Support/ScanBench.h"

#include <QDir>
#include <QSet>

namespace {

/// Debian's zam-plugins and dpf-plugins-vst by "Vendor|Width|Category", as their sources state them. Those of
/// the first two rows exist as VST 3 too.
const std::pair<const char *, const char *> kPlugins[] = {
    {"Damien Zammit|1|1",
     "ZaMultiComp,ZamAutoSat,ZamComp,ZamDelay,ZamDynamicEQ,ZamEQ2,ZamGEQ31,ZamGate,ZamGrains,"
     "ZamPhono,ZamTube"},
    {"Damien Zammit|2|1", "ZaMaximX2,ZaMultiCompX2,ZamCompX2,ZamGateX2,ZamHeadX2,ZamVerb"},
    {"DISTRHO|1|1", "MaFreeverb,glBars"},
    {"DISTRHO|2|1", "3 Band EQ,MaBitcrush,MaGigaverb,MaPitchshift,Ping Pong Pan,ProM"},
    {"DISTRHO|6|1", "3 Band Splitter"},
    {"Martin Eastwood, falkTX|2|1", "MVerb"},
    {"Sean Bolton, falkTX|1|2", "Nekobi-vst"},
    {"falkTX|1|2", "Kars-vst"},
    {"ndc Plugs|1|1", "Cycle Shifter"},
    {"ndc Plugs|2|1", "Amplitude Imposer,Soul Force"}};

using RealPlugins = ScanBench;

/// What there is to find; where the plug-ins are built for another system, only some are there.
QSet<QString> expectedRows(bool isVst3)
{
    const QStringList built = QStringLiteral(FXPROBE_REAL_PLUGINS).split(',', Qt::SkipEmptyParts);
    QSet<QString> rows;
    for (const auto &[row, names] : kPlugins)
        for (const QString &name : QString(names).split(','))
            if ((built.isEmpty() || built.contains(name)) &&
                (!isVst3 || QString(row).startsWith("Damien Zammit")))
                rows.insert(name + '|' + (isVst3 ? QString(row).chopped(2) : row) + "|1|1");
    return rows;
}

} // namespace

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
    EXPECT_EQ(QSet<QString>(vst2.begin(), vst2.end()), expectedRows(false));
    EXPECT_EQ(QSet<QString>(vst3.begin(), vst3.end()), expectedRows(true));
    EXPECT_GE(first.log.count("Probing "), vst2.size() + vst3.size());
    EXPECT_EQ(scanOnce(environment).log.count("Probing "), 0);
}
