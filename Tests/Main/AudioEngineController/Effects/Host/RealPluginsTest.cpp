#include "Tests/Main/AudioEngineController/Effects/VST/VSTScanBench.h"

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

class RealPlugins : public VSTScanBench {
protected:
    /// How many modules a run probed.
    int probedInARun() const
    {
        ScannerRun run(QStringLiteral(FXPROBE), m_folder);
        run.setEnvironment("FXPROBE_TRACE", "1");
        run.setEnvironment("LSAN_OPTIONS", "detect_leaks=0"); // theirs
        const ScannerOutcome outcome = run.run();
        EXPECT_TRUE(outcome.succeeded()) << qPrintable(outcome.log);
        return outcome.log.count("Probing ");
    }
    /// The rows of the records of a catalogue, all of which must work.
    QSet<QString> rowsOf(const char *catalogue, const char *elements) const
    {
        const QStringList rows = recordsOf(QLatin1String(catalogue), elements);
        const QStringList states = recordsOf(QLatin1String(catalogue), "Enabled Working");
        EXPECT_EQ(states.count("1|1"), rows.size());
        return QSet<QString>(rows.begin(), rows.end());
    }
};

} // namespace

TEST_F(RealPlugins, AreFoundOnceAndThenKnown)
{
    const QString folder = QStringLiteral(FXPROBE_REAL_PLUGIN_FOLDER);
    // Where they are built for another system, only some are there.
    const QStringList built = QStringLiteral(FXPROBE_REAL_PLUGINS).split(',', Qt::SkipEmptyParts);
    QSet<QString> vst2, vst3;
    for (const auto &[row, names] : kPlugins)
        for (const QString &name : QString(names).split(',')) {
            if (!built.isEmpty() && !built.contains(name))
                continue;
            vst2.insert(name + '|' + row);
            if (QString(row).startsWith("Damien Zammit"))
                vst3.insert(name + '|' + QString(row).chopped(2));
        }
    const QStringList scanned{folder + "/vst", folder + "/vst3"};
    if (QDir(scanned[0]).count() < uint(vst2.size()) || QDir(scanned[1]).count() < uint(vst3.size()))
        GTEST_SKIP() << "Debian's zam-plugins and dpf-plugins-vst are not in " << qPrintable(folder);
    m_folder.writeScanList(scanned);
    EXPECT_GE(probedInARun(), vst2.size() + vst3.size());
    EXPECT_EQ(rowsOf("FXConfiguration.xml", "Name Vendor Width Category"), vst2);
    EXPECT_TRUE(rowsOf("VST3Configuration.xml", "Name Vendor Inputs").contains(vst3))
        << "perhaps among others";
    EXPECT_EQ(probedInARun(), 0);
}
