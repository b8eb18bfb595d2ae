#include "Tests/Main/AudioEngineController/Effects/RealPlugins.h"
#include "Tests/Main/AudioEngineController/Effects/VST/VSTScanBench.h"

#include <QDir>

namespace {

const QString kPlugins = QStringLiteral(FXPROBE_REAL_PLUGIN_FOLDER "/vst");

/// Debian's zam-plugins and dpf-plugins-vst: name, vendor, width and category, as their sources state them.
constexpr const char *kExpected[] = {
    "3 Band EQ|DISTRHO|2|1",
    "3 Band Splitter|DISTRHO|6|1",
    "Amplitude Imposer|ndc Plugs|2|1",
    "Cycle Shifter|ndc Plugs|1|1",
    "Kars-vst|falkTX|1|2",
    "MVerb|Martin Eastwood, falkTX|2|1",
    "MaBitcrush|DISTRHO|2|1",
    "MaFreeverb|DISTRHO|1|1",
    "MaGigaverb|DISTRHO|2|1",
    "MaPitchshift|DISTRHO|2|1",
    "Nekobi-vst|Sean Bolton, falkTX|1|2",
    "Ping Pong Pan|DISTRHO|2|1",
    "ProM|DISTRHO|2|1",
    "Soul Force|ndc Plugs|2|1",
    "ZaMaximX2|Damien Zammit|2|1",
    "ZaMultiComp|Damien Zammit|1|1",
    "ZaMultiCompX2|Damien Zammit|2|1",
    "ZamAutoSat|Damien Zammit|1|1",
    "ZamComp|Damien Zammit|1|1",
    "ZamCompX2|Damien Zammit|2|1",
    "ZamDelay|Damien Zammit|1|1",
    "ZamDynamicEQ|Damien Zammit|1|1",
    "ZamEQ2|Damien Zammit|1|1",
    "ZamGEQ31|Damien Zammit|1|1",
    "ZamGate|Damien Zammit|1|1",
    "ZamGateX2|Damien Zammit|2|1",
    "ZamGrains|Damien Zammit|1|1",
    "ZamHeadX2|Damien Zammit|2|1",
    "ZamPhono|Damien Zammit|1|1",
    "ZamTube|Damien Zammit|1|1",
    "ZamVerb|Damien Zammit|2|1",
    "glBars|DISTRHO|1|1",
};

class VSTRealPlugins : public VSTScanBench {
protected:
    /// How many modules a run probed.
    int probedInARun()
    {
        ScannerRun run(QStringLiteral(FXPROBE), m_folder);
        run.setEnvironment(QStringLiteral("FXPROBE_TRACE"), QStringLiteral("1"));
        run.setEnvironment(QStringLiteral("LSAN_OPTIONS"), QStringLiteral("detect_leaks=0")); // theirs
        const ScannerOutcome outcome = run.run();
        EXPECT_TRUE(outcome.succeeded()) << qPrintable(outcome.log);
        return outcome.log.count(QStringLiteral("Probing "));
    }
};

} // namespace

TEST_F(VSTRealPlugins, AreFoundOnceAndThenKnown)
{
    const QStringList expected = rowsOfRealPlugins(kExpected);
    if (QDir(kPlugins).entryList(QDir::AllEntries | QDir::NoDotAndDotDot).size() < expected.size())
        GTEST_SKIP() << "Debian's zam-plugins and dpf-plugins-vst are not in " << qPrintable(kPlugins);
    m_folder.writeScanList({kPlugins});
    EXPECT_EQ(probedInARun(), expected.size());
    EXPECT_EQ(sortedRecords("Name Vendor Width Category"), expected);
    EXPECT_EQ(records("Working").count(QStringLiteral("1")), expected.size());
    EXPECT_EQ(probedInARun(), 0);
}
