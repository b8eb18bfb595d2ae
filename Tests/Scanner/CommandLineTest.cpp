#include "Tests/Support/PlatformValues.h"
#include "Tests/Support/ScanBench.h"

#include <QDir>
#include <QDirIterator>
#include <QFile>

namespace {

const QString kBelowHome = "AppData/Roaming/Morrow Labs/Quillon/Preferences/Tessel/";

class CommandLine : public ScanBench {
protected:
    ScannerOutcome runWith(const QStringList &arguments) const
    {
        ScannerRun scanner(scannerProgram(), m_folder);
        scanner.setArguments(arguments);
        for (const char *home : {"HOME", "USERPROFILE"})
            scanner.setEnvironment(QLatin1String(home), m_folder.dataFolder());
        scanner.setWorkingFolder(m_folder.dataFolder());
        scanner.setEnvironment("LC_ALL", "C");
        forgetTrace();
        return scanner.run();
    }
    /// The catalogues anywhere below the data folder.
    QStringList catalogues() const
    {
        QStringList found;
        QDirIterator files(m_folder.dataFolder(), {"VST3Configuration.xml"}, QDir::Files,
                           QDirIterator::Subdirectories);
        while (files.hasNext())
            found.append(QDir(m_folder.dataFolder()).relativeFilePath(files.next()));
        return found;
    }
};

/// More than 500 characters.
QString longFolder() { return QString(200, 'a') + '/' + QString(200, 'b') + '/' + QString(100, 'c'); }

} // namespace

TEST_F(CommandLine, NothingIsDoneWithoutAScanList)
{
    put("Comp.vst3");
    const QString missing = m_folder.path("Effects/Missing.xml");
    const QByteArray outdated = "REWIRE VERSION UPDATE REQUIRED";
    const struct {
        const char *name;
        QStringList arguments;
        int exitCode;
        QByteArray output;
    } rows[] = {
        {"no argument and no scan list below the home folder", {}, 0, ""},
        {"a missing file before one that exists", {missing, m_folder.scanList()}, 0, ""},
        {"an empty argument", {QString()}, 0, ""},
        {"version probe with a scan list behind it", {"-rewire_version", m_folder.scanList()}, 1, outdated},
        {"version probe in capitals is a missing file", {"-REWIRE_VERSION"}, 0, ""},
        {"version probe with more behind it is a missing file", {"-rewire_version2"}, 0, ""},
        {"help with a scan list behind it", {"--help", m_folder.scanList()}, 0, "Usage: FxProbe [FILE"},
        {"version", {"-v"}, 0, "FxProbe "},
    };
    const auto before = effectsFolder();
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        const ScannerOutcome outcome = runWith(row.arguments);
        EXPECT_EQ(outcome.exitCode, row.exitCode);
        EXPECT_TRUE(outcome.standardOutput.startsWith(row.output)) << outcome.standardOutput.constData();
        EXPECT_EQ(outcome.standardOutput.isEmpty(), row.output.isEmpty());
        EXPECT_EQ(outcome.log, QString());
        EXPECT_EQ(effectsFolder(), before);
        EXPECT_EQ(loaded(), QStringList());
    }
}

TEST_F(CommandLine, ThePathDecidesWhereTheCatalogueLands)
{
    if (QDir("/Effects").exists())
        GTEST_SKIP() << "the file system's root has a folder \"Effects\"";
    const QString foreign = "効果 🎛 Ünï";
    const struct {
        const char *name;
        QString argument; ///< in the data folder, which "@" stands for; null: none
        QString effects;  ///< the folder that the catalogue lands in; null: nowhere
    } rows[] = {
        {"no argument", {}, kBelowHome + "Effects"},
        {"full path, another file name", "@a/Effects/x", "a/Effects"},
        {"the last Effects counts", "@a/Effects/b/Effects/f", "a/Effects/b/Effects"},
        {"a folder below Effects", "@a/Effects/b/f", "a/Effects"},
        {"lower case is another folder", "@a/effects/f", {}},
        {"a longer name is another folder", "@a/MyEffects/f", {}},
        {"relative path with dots", "./a/../a/Effects/f", "a/Effects"},
        {"relative path without a data folder", "Effects/f", "Effects"},
        {"the slash wins over a later backslash", "@a/Effects/b\\Effects\\f", "a/Effects"},
        {"Japanese and emoji", '@' + foreign + "/Effects/f", foreign + "/Effects"},
        {"500 characters", '@' + longFolder() + "/Effects/f", longFolder() + "/Effects"},
    };
    const QString module = put(foreign + ".vst3");
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        const bool isGiven = !row.argument.isNull();
        if (!isGiven && !kHomeFollowsEnvironment)
            continue;
        const QString argument = QString(row.argument).replace('@', m_folder.dataFolder() + '/');
        const QString scanList = m_folder.path(isGiven ? argument : row.effects + "/FXScan.xml");
        m_folder.write(scanList, m_folder.read(m_folder.scanList()));
        const ScannerOutcome outcome = runWith(isGiven ? QStringList(argument) : QStringList());
        const QString catalogue = row.effects + "/VST3Configuration.xml";
        const bool isWritten = !row.effects.isNull();
        EXPECT_TRUE(outcome.succeeded());
        EXPECT_EQ(loaded(), QStringList(foreign));
        EXPECT_EQ(catalogues(), isWritten ? QStringList(catalogue) : QStringList());
        EXPECT_EQ(m_folder.read(catalogue).contains(module.toUtf8()), isWritten);
        EXPECT_EQ(outcome.log.contains("Cannot write the"), !isWritten) << qPrintable(outcome.log);
        QFile::remove(m_folder.path(catalogue));
        QFile::remove(scanList);
    }
}
