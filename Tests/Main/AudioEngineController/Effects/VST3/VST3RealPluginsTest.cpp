#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QDir>
#include <QFileInfo>
#include <QProcess>

namespace {

const QString kPlugins = QStringLiteral("/usr/lib/vst3");

/// Name, vendor and inputs of the plug-ins of Debian's zam-plugins, without side chains, as the descriptions
/// of the same plug-ins in another format have them.
const char *const kExpected[] = {
    "ZaMaximX2|Damien Zammit|2",  "ZaMultiComp|Damien Zammit|1",  "ZaMultiCompX2|Damien Zammit|2",
    "ZamAutoSat|Damien Zammit|1", "ZamComp|Damien Zammit|1",      "ZamCompX2|Damien Zammit|2",
    "ZamDelay|Damien Zammit|1",   "ZamDynamicEQ|Damien Zammit|1", "ZamEQ2|Damien Zammit|1",
    "ZamGEQ31|Damien Zammit|1",   "ZamGate|Damien Zammit|1",      "ZamGateX2|Damien Zammit|2",
    "ZamGrains|Damien Zammit|1",  "ZamHeadX2|Damien Zammit|2",    "ZamPhono|Damien Zammit|1",
    "ZamTube|Damien Zammit|1",    "ZamVerb|Damien Zammit|2"};

class VST3RealPlugins : public VST3ScanBench {
protected:
    void SetUp() override
    {
        if (!QFileInfo::exists(kPlugins + QStringLiteral("/ZamVerb.vst3")))
            GTEST_SKIP() << "Debian's zam-plugins are not installed in " << qPrintable(kPlugins);
        for (const QFileInfo &plugin : QDir(kPlugins).entryInfoList({QStringLiteral("Za*.vst3")}))
            EXPECT_EQ(QProcess::execute(QStringLiteral("cp"),
                                        {QStringLiteral("-a"), plugin.filePath(), m_folder.plugins()}),
                      0);
    }

    /// One run; gives the plug-ins that the system's loader opened in it, sorted.
    QStringList namesOfLoaded()
    {
        ScannerRun run(QStringLiteral(FXPROBE), m_folder);
        run.setEnvironment(QStringLiteral("LD_DEBUG"), QStringLiteral("files"));
        run.setEnvironment(QStringLiteral("FXPROBE_TRACE"), QStringLiteral("1"));
        run.setEnvironment(QStringLiteral("LSAN_OPTIONS"), QStringLiteral("detect_leaks=0")); // theirs
        m_outcome = run.run();
        EXPECT_TRUE(m_outcome.succeeded()) << qPrintable(m_outcome.log);
        QStringList names;
        for (const QByteArray &line : m_outcome.standardError.split('\n'))
            if (line.contains("calling init: ") && line.contains(m_folder.plugins().toUtf8()))
                names.append(QFileInfo(QString::fromUtf8(line)).completeBaseName());
        names.sort();
        return names;
    }

    ScannerOutcome m_outcome;
};

} // namespace

TEST_F(VST3RealPlugins, AreFoundOnceAndThenKnown)
{
    QStringList expected;
    QStringList names;
    for (const char *plugin : kExpected) {
        expected.append(QString::fromLatin1(plugin));
        names.append(expected.last().section(QLatin1Char('|'), 0, 0));
    }
    EXPECT_EQ(namesOfLoaded(), names);
    EXPECT_EQ(m_outcome.log.count(QStringLiteral("Probing ")), names.size());
    QStringList found = sortedRecords("Name Vendor Inputs");
    expected.sort();
    EXPECT_EQ(found, expected);
    EXPECT_EQ(records("Enabled Working").count(QStringLiteral("1|1")), names.size());

    const QByteArray catalogue = m_folder.catalogue();
    EXPECT_EQ(namesOfLoaded(), QStringList());
    EXPECT_EQ(m_outcome.log.count(QStringLiteral("Probing ")), 0);
    EXPECT_EQ(m_folder.catalogue(), catalogue);

    m_folder.setModified(vst3BundleBinary(modulePath(QStringLiteral("ZamDelay"))),
                         QDateTime({2022, 3, 4}, {5, 6}));
    EXPECT_EQ(namesOfLoaded(), texts({"ZamDelay"}));
    EXPECT_EQ(records("Name").size(), names.size());
}
