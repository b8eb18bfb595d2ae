#include "Tests/Main/AudioEngineController/Effects/RealPlugins.h"
#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QDirIterator>
#include <QFileInfo>

namespace {

const QString kPlugins = QStringLiteral(FXPROBE_REAL_PLUGIN_FOLDER "/vst3");

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
        QDirIterator files(kPlugins, QDir::Files, QDirIterator::Subdirectories);
        if (!files.hasNext())
            GTEST_SKIP() << "Debian's zam-plugins are not in " << qPrintable(kPlugins);
        while (files.hasNext()) {
            const QString file = files.next();
            if (file.startsWith(kPlugins + QStringLiteral("/Za")))
                copyOver(file, m_folder.plugins() + file.mid(kPlugins.size()));
        }
    }

    static void copyOver(const QString &file, const QString &copy)
    {
        EXPECT_TRUE(QDir().mkpath(QFileInfo(copy).path()) && QFile::copy(file, copy)) << qPrintable(copy);
    }

    /// One run; gives the plug-ins that it probed, sorted.
    QStringList namesOfProbed()
    {
        ScannerRun run(QStringLiteral(FXPROBE), m_folder);
        run.setEnvironment(QStringLiteral("FXPROBE_TRACE"), QStringLiteral("1"));
        run.setEnvironment(QStringLiteral("LSAN_OPTIONS"), QStringLiteral("detect_leaks=0")); // theirs
        m_outcome = run.run();
        EXPECT_TRUE(m_outcome.succeeded()) << qPrintable(m_outcome.log);
        QStringList names;
        for (const QString &line : m_outcome.log.split(QLatin1Char('\n')))
            if (line.contains(QStringLiteral("Probing ")))
                names.append(QFileInfo(line).completeBaseName());
        names.sort();
        return names;
    }

    ScannerOutcome m_outcome;
};

} // namespace

TEST_F(VST3RealPlugins, AreFoundOnceAndThenKnown)
{
    const QStringList expected = rowsOfRealPlugins(kExpected);
    QStringList names;
    for (const QString &row : expected)
        names.append(row.section(QLatin1Char('|'), 0, 0));
    names.sort();
    EXPECT_EQ(namesOfProbed(), names);
    EXPECT_EQ(sortedRecords("Name Vendor Inputs"), expected);
    EXPECT_EQ(records("Enabled Working").count(QStringLiteral("1|1")), names.size());

    const QByteArray catalogue = m_folder.catalogue();
    EXPECT_EQ(namesOfProbed(), QStringList());
    EXPECT_EQ(m_folder.catalogue(), catalogue);

    m_folder.setModified(vst3BundleBinary(modulePath(QStringLiteral("ZamDelay"))),
                         QDateTime({2022, 3, 4}, {5, 6}));
    EXPECT_EQ(namesOfProbed(), texts({"ZamDelay"}));
    EXPECT_EQ(records("Name").size(), names.size());
}
