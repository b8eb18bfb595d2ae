#include "Tests/Scanner/ScannerTest.h"
#include "Tests/Support/PlatformValues.h"

#include <QDir>
#include <QFile>

namespace {

const char kScanListBelowHome[] = "AppData/Roaming/Morrow Labs/Quillon/Preferences/Tessel/Effects/FXScan.xml";
const char kCatalogueBelowHome[] =
    "AppData/Roaming/Morrow Labs/Quillon/Preferences/Tessel/Effects/VST3Configuration.xml";

class CommandLine : public ScannerTest {
protected:
    ScannerOutcome runWith(const QStringList &arguments) const
    {
        ScannerRun scanner(scannerProgram(), m_folder);
        scanner.setArguments(arguments);
        for (const char *home : {"HOME", "USERPROFILE"})
            scanner.setEnvironment(QLatin1String(home), m_folder.dataFolder());
        scanner.setWorkingFolder(m_folder.dataFolder());
        scanner.setEnvironment(QStringLiteral("LC_ALL"), QStringLiteral("C"));
        scanner.setTimeLimit(std::chrono::seconds(20));
        return scanner.run();
    }
    /// A catalogue anywhere below the data folder.
    QStringList catalogues() const
    {
        QStringList found;
        findCatalogues(QString(), found);
        return found;
    }

private:
    void findCatalogues(const QString &below, QStringList &found) const
    {
        const QDir folder(m_folder.path(below));
        for (const QString &name : folder.entryList(QDir::AllEntries | QDir::NoDotAndDotDot)) {
            if (name == QLatin1String("VST3Configuration.xml"))
                found.append(below + name);
            else if (QFileInfo(folder.filePath(name)).isDir())
                findCatalogues(below + name + QLatin1Char('/'), found);
        }
    }
};

/// More than 500 characters.
QString longFolder()
{
    return QString(200, QLatin1Char('a')) + QLatin1Char('/') + QString(200, QLatin1Char('b')) +
           QLatin1Char('/') + QString(100, QLatin1Char('c'));
}

} // namespace

TEST_F(CommandLine, NothingIsDoneWithoutAScanList)
{
    addModule(QStringLiteral("Comp"));
    const QString missing = m_folder.path(QStringLiteral("Effects/Missing.xml"));
    const struct {
        const char *name;
        QStringList arguments;
        int exitCode;
        QByteArray output;
    } rows[] = {
        {"no argument and no scan list below the home folder", {}, 0, ""},
        {"a missing file", {missing}, 0, ""},
        {"a missing file before one that exists", {missing, m_folder.scanList()}, 0, ""},
        {"an empty argument", {QString()}, 0, ""},
        {"version probe", {QStringLiteral("-rewire_version")}, 1, "REWIRE VERSION UPDATE REQUIRED\n"},
        {"version probe with a scan list behind it",
         {QStringLiteral("-rewire_version"), m_folder.scanList()},
         1,
         "REWIRE VERSION UPDATE REQUIRED\n"},
        {"version probe in capitals is a missing file", {QStringLiteral("-REWIRE_VERSION")}, 0, ""},
        {"version probe with more behind it is a missing file", {QStringLiteral("-rewire_version2")}, 0, ""},
        {"version probe after a blank is a missing file", {QStringLiteral(" -rewire_version")}, 0, ""},
    };
    const auto before = effectsFolder();
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        const ScannerOutcome outcome = runWith(row.arguments);
        EXPECT_EQ(outcome.exitCode, row.exitCode);
        EXPECT_EQ(outcome.standardOutput, textLines(row.output));
        EXPECT_EQ(outcome.log, QString());
        EXPECT_EQ(effectsFolder(), before);
        EXPECT_EQ(loaded(), QStringList());
    }
}

TEST_F(CommandLine, ThePathDecidesWhereTheCatalogueLands)
{
    if (QDir(QStringLiteral("/Effects")).exists())
        GTEST_SKIP() << "the file system's root has a folder \"Effects\"";
    const QString there = m_folder.dataFolder() + QLatin1Char('/');
    const QString foreign = QString::fromUtf8("効果 🎛 Ünï");
    const struct {
        const char *name;
        QString scanList;  ///< where it lies below the data folder
        QString argument;  ///< as given
        QString catalogue; ///< null: nowhere
    } rows[] = {
        {"no argument", kScanListBelowHome, {}, kCatalogueBelowHome},
        {"full path", "a/Effects/FXScan.xml", there + "a/Effects/FXScan.xml",
         "a/Effects/VST3Configuration.xml"},
        {"another file name", "a/Effects/x", there + "a/Effects/x", "a/Effects/VST3Configuration.xml"},
        {"the last Effects counts", "a/Effects/b/Effects/f", there + "a/Effects/b/Effects/f",
         "a/Effects/b/Effects/VST3Configuration.xml"},
        {"a folder below Effects", "a/Effects/b/f", there + "a/Effects/b/f",
         "a/Effects/VST3Configuration.xml"},
        {"lower case is another folder", "a/effects/f", there + "a/effects/f", {}},
        {"a longer name is another folder", "a/MyEffects/f", there + "a/MyEffects/f", {}},
        {"relative path", "a/Effects/f", "a/Effects/f", "a/Effects/VST3Configuration.xml"},
        {"relative path with dots", "a/Effects/f", "./a/../a/Effects/f", "a/Effects/VST3Configuration.xml"},
        {"relative path without a data folder", "Effects/f", "Effects/f", {}},
        {"both separators", "C\\x/Effects/f", there + "C\\x/Effects/f",
         QDir::fromNativeSeparators("C\\x/Effects/VST3Configuration.xml")},
        {"the slash wins over a later backslash", "a/Effects/b\\Effects\\f",
         there + "a/Effects/b\\Effects\\f", "a/Effects/VST3Configuration.xml"},
        {"Japanese and emoji", foreign + "/Effects/f", there + foreign + "/Effects/f",
         foreign + "/Effects/VST3Configuration.xml"},
        {"500 characters", longFolder() + "/Effects/f", there + longFolder() + "/Effects/f",
         longFolder() + "/Effects/VST3Configuration.xml"},
    };
    const QString module = addModule(foreign);
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        if (row.argument.isNull() && !kHomeFollowsEnvironment)
            continue;
        m_folder.write(row.scanList, m_folder.read(m_folder.scanList()));
        forgetTrace();
        const ScannerOutcome outcome =
            runWith(row.argument.isNull() ? QStringList() : QStringList(row.argument));
        EXPECT_TRUE(outcome.succeeded());
        EXPECT_EQ(loaded(), QStringList(foreign));
        EXPECT_EQ(catalogues(), row.catalogue.isNull() ? QStringList() : QStringList(row.catalogue));
        const QByteArray text = m_folder.read(row.catalogue.isNull() ? m_folder.scanList() : row.catalogue);
        EXPECT_EQ(text.contains(module.toUtf8()), !row.catalogue.isNull()) << text.constData();
        // A catalogue that has no place is told about, and nothing else.
        EXPECT_EQ(logLines(outcome).filter(QStringLiteral("Cannot write the")).isEmpty(),
                  !row.catalogue.isNull())
            << qPrintable(outcome.log);
        QFile::remove(m_folder.path(row.catalogue));
        QFile::remove(m_folder.path(row.scanList));
    }
}

TEST_F(CommandLine, FurtherArgumentsAreIgnored)
{
    addModule(QStringLiteral("Comp"));
    EXPECT_TRUE(runWith({m_folder.scanList(), QStringLiteral("-rewire_version")}).succeeded());
    EXPECT_EQ(listed(), QStringList(QStringLiteral("Comp")));
}
