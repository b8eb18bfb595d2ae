#include "Tests/Scanner/ScannerTest.h"

#include <QFile>
#include <QFileInfo>

namespace {

const char kEmptyCatalogue[] = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                               "<Effects version=\"1.1\">\n"
                               "</Effects>\n";

class ScanFolders : public ScannerTest {
protected:
    /// Runs with a scan list of these folders.
    ScannerOutcome runFolders(const QStringList &folders) const
    {
        m_folder.writeScanList(folders);
        return run();
    }
};

} // namespace

TEST_F(ScanFolders, ScanListsThatNameNothing)
{
    addModule("Comp");
    const struct {
        const char *name;
        QByteArray scanList;
        int logged; ///< lines about it
    } rows[] = {
        {"an empty file", "", 1},
        {"no XML", "C:\\Plugins\n", 1},
        {"bytes", QByteArray("\xFF\xFE\0\0<\0S", 8), 1},
        {"cut in the middle of its first folder", "<Scan>\n\t<Path>/nowhere</Pa", 1},
        {"another root", "<Folders><Path>/nowhere</Path></Folders>", 0},
        {"no folder", "<Scan></Scan>", 0},
        {"other elements", "<Scan><Folder>/nowhere</Folder><Group><Path>/nowhere</Path></Group></Scan>", 0},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        m_folder.write(m_folder.scanList(), row.scanList);
        QFile::remove(cataloguePath());
        const ScannerOutcome outcome = run();
        EXPECT_TRUE(outcome.succeeded());
        EXPECT_EQ(m_folder.catalogue(), textLines(kEmptyCatalogue));
        EXPECT_EQ(m_folder.read(m_folder.scanList()), row.scanList);
        EXPECT_EQ(logLines(outcome).size(), row.logged) << qPrintable(outcome.log);
        EXPECT_EQ(outcome.log.count(m_folder.scanList()), row.logged) << qPrintable(outcome.log);
    }
    EXPECT_EQ(loaded(), QStringList());
}

TEST_F(ScanFolders, AFolderThatCannotBeSearchedCostsOneLogLine)
{
    const QString shut = m_folder.path("Shut");
    m_folder.write("File", "x");
    m_folder.write("Shut/x", "x");
    const struct {
        const char *name;
        QString folder;
        const char *reason;
    } rows[] = {
        {"does not exist", m_folder.path("Missing"), "it does not exist"},
        {"does not exist, foreign letters", m_folder.path("無い 🎛"), "it does not exist"},
        {"is a file", m_folder.path("File"), "it is not a folder"},
        {"is an empty path, not the working folder", QString(""), "no folder is given"},
        {"is not readable", shut, "Permission denied"},
    };
    addModule("Comp");
    QFile::setPermissions(shut, QFile::Permissions());
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        if (row.folder == shut && QFileInfo(shut).isReadable())
            continue; // the superuser reads everything
        const ScannerOutcome outcome = runFolders({row.folder, m_folder.plugins()});
        EXPECT_TRUE(outcome.succeeded());
        EXPECT_EQ(logLines(outcome), QStringList(QStringLiteral("Cannot search the folder \"%1\": %2")
                                                     .arg(row.folder, QLatin1String(row.reason))));
        EXPECT_EQ(listed(), QStringList("Comp"));
    }
    QFile::setPermissions(shut, QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner);
}

TEST_F(ScanFolders, AModuleReachedInSeveralWaysIsProbedOnce)
{
    const QString folder = m_folder.plugins();
    const QString inner = folder + "/Inner";
    addVST3File(inner, "Deep", "trace \"" + tracePath().toUtf8() + "\" Deep\nclass Deep\n");
    addModule("Comp");
    const struct {
        const char *name;
        QStringList folders;
        QStringList order;
    } rows[] = {
        {"the same folder twice", {folder, folder}, {"Comp", "Deep"}},
        {"with and without a slash behind it", {folder, folder + '/'}, {"Comp", "Deep"}},
        {"a folder inside another, listed later", {folder, inner}, {"Comp", "Deep"}},
        {"a folder inside another, listed first", {inner, folder}, {"Deep", "Comp"}},
        {"a detour", {inner + "/..", folder}, {"Comp", "Deep"}},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        QFile::remove(cataloguePath());
        forgetTrace();
        const ScannerOutcome outcome = runFolders(row.folders);
        EXPECT_TRUE(outcome.succeeded());
        EXPECT_EQ(loaded(), row.order);
        EXPECT_EQ(logLines(outcome), QStringList());
        EXPECT_EQ(listed(), QStringList({"Comp", "Deep"}));
    }
}
