#include "Tests/Main/AudioEngineController/Effects/VST/VSTScanBench.h"

#include <QDir>
#include <QSet>

namespace {

/// Debian's zam-plugins and dpf-plugins-vst: name, vendor, width and category, as their sources state them.
const char *const kVst2[] = {
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

/// Name, vendor and inputs of the plug-ins of Debian's zam-plugins, without side chains, as the descriptions
/// of the same plug-ins in another format have them.
const char *const kVst3[] = {
    "ZaMaximX2|Damien Zammit|2",  "ZaMultiComp|Damien Zammit|1",  "ZaMultiCompX2|Damien Zammit|2",
    "ZamAutoSat|Damien Zammit|1", "ZamComp|Damien Zammit|1",      "ZamCompX2|Damien Zammit|2",
    "ZamDelay|Damien Zammit|1",   "ZamDynamicEQ|Damien Zammit|1", "ZamEQ2|Damien Zammit|1",
    "ZamGEQ31|Damien Zammit|1",   "ZamGate|Damien Zammit|1",      "ZamGateX2|Damien Zammit|2",
    "ZamGrains|Damien Zammit|1",  "ZamHeadX2|Damien Zammit|2",    "ZamPhono|Damien Zammit|1",
    "ZamTube|Damien Zammit|1",    "ZamVerb|Damien Zammit|2"};

/// The rows of the plug-ins that are there to scan: of all, or, where they are built for another system, of
/// those of a list (of names between commas).
QSet<QString> rowsHere(const char *const *begin, const char *const *end)
{
    const QString list = QStringLiteral(FXPROBE_REAL_PLUGINS);
    QSet<QString> rows;
    for (const char *const *row = begin; row != end; ++row) {
        const QString text = QString::fromUtf8(*row);
        if (list.isEmpty() || list.split(QLatin1Char(',')).contains(text.section(QLatin1Char('|'), 0, 0)))
            rows.insert(text);
    }
    return rows;
}

class RealPlugins : public VSTScanBench {
protected:
    /// How many modules a run probed.
    int probedInARun() const
    {
        ScannerRun run(QStringLiteral(FXPROBE), m_folder);
        run.setEnvironment(QStringLiteral("FXPROBE_TRACE"), QStringLiteral("1"));
        run.setEnvironment(QStringLiteral("LSAN_OPTIONS"), QStringLiteral("detect_leaks=0")); // theirs
        const ScannerOutcome outcome = run.run();
        EXPECT_TRUE(outcome.succeeded()) << qPrintable(outcome.log);
        return outcome.log.count(QStringLiteral("Probing "));
    }
    /// The rows of the records of a catalogue, all of which must work.
    QSet<QString> rowsOf(const char *catalogue, const char *elements) const
    {
        const QStringList rows = recordsOf(QLatin1String(catalogue), elements);
        const QStringList states = recordsOf(QLatin1String(catalogue), "Enabled Working");
        EXPECT_EQ(states.count(QStringLiteral("1|1")), rows.size());
        return QSet<QString>(rows.begin(), rows.end());
    }
};

} // namespace

TEST_F(RealPlugins, AreFoundOnceAndThenKnown)
{
    const QString folder = QStringLiteral(FXPROBE_REAL_PLUGIN_FOLDER);
    const QSet<QString> vst2 = rowsHere(std::begin(kVst2), std::end(kVst2));
    const QSet<QString> vst3 = rowsHere(std::begin(kVst3), std::end(kVst3));
    const QStringList scanned{folder + QStringLiteral("/vst"), folder + QStringLiteral("/vst3")};
    if (QDir(scanned[0]).count() < uint(vst2.size()) || QDir(scanned[1]).count() < uint(vst3.size()))
        GTEST_SKIP() << "Debian's zam-plugins and dpf-plugins-vst are not in " << qPrintable(folder);
    m_folder.writeScanList(scanned);
    EXPECT_GE(probedInARun(), vst2.size() + vst3.size());
    EXPECT_EQ(rowsOf("FXConfiguration.xml", "Name Vendor Width Category"), vst2);
    EXPECT_TRUE(rowsOf("VST3Configuration.xml", "Name Vendor Inputs").contains(vst3))
        << "perhaps among others";
    EXPECT_EQ(probedInARun(), 0);
}
