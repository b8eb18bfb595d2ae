#include "Tests/Scanner/ScannerTest.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

namespace {

const QString kComp = "Comp";

class CatalogueState : public ScannerTest {
protected:
    QString temporaryPath() const { return cataloguePath() + ".tmp"; }
    QDateTime modified() const { return QFileInfo(cataloguePath()).lastModified(); }
};

} // namespace

TEST_F(CatalogueState, AnUnusableCatalogueIsReplaced)
{
    addListedModules({kComp});
    const QByteArray good = m_folder.catalogue();
    const struct {
        const char *name;
        QByteArray text;
    } rows[] = {
        {"an empty file", ""},
        {"no XML", "not a catalogue\n"},
        {"another root", "<Scan></Scan>"},
        {"bytes", QByteArray("\0\xFF\xFE<Effects", 11)},
        {"cut in the middle of a record", good.left(good.indexOf("<Vendor>"))},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        m_folder.write(cataloguePath(), row.text);
        forgetTrace();
        const ScannerOutcome outcome = run();
        EXPECT_TRUE(outcome.succeeded());
        EXPECT_EQ(m_folder.catalogue(), good);
        EXPECT_EQ(logLines(outcome).filter("Cannot use the catalogue " + cataloguePath()).size(), 1)
            << qPrintable(outcome.log);
    }
}

TEST_F(CatalogueState, WhatCrashedIsSalvagedFromADamagedOneAndWrittenAgain)
{
    addListedModules({kComp});
    editCatalogue("<Enabled>1<", "<Enabled>0<");
    editCatalogue("<Working>1<", "<Working>0<");
    const QByteArray good = m_folder.catalogue();
    m_folder.write(cataloguePath(), good.left(good.indexOf("</Effects>")));
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(loaded(), QStringList());
    EXPECT_EQ(m_folder.catalogue(), good);

    // Of a version before the first: what it says means nothing to us.
    editCatalogue("<Effects version=\"1.1\">", "<Scan>");
    editCatalogue("</Effects>", "</Scan>");
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(loaded(), QStringList(kComp));
}

TEST_F(CatalogueState, AFolderInThePlaceOfTheCatalogueStays)
{
    addModule(kComp);
    m_folder.write("Effects/VST3Configuration.xml/kept", "old");
    const ScannerOutcome outcome = run();
    EXPECT_TRUE(outcome.succeeded());
    EXPECT_EQ(loaded(), QStringList()) << "nothing would come of it";
    EXPECT_FALSE(logLines(outcome).filter("Cannot write the catalogue").isEmpty()) << qPrintable(outcome.log);
    EXPECT_EQ(QDir(cataloguePath()).entryList(QDir::Files), QStringList("kept"));
    EXPECT_EQ(m_folder.markers(), QStringList());
    EXPECT_FALSE(QFileInfo::exists(temporaryPath()));
}

TEST_F(CatalogueState, LeftoversOfATemporaryFileDoNoHarm)
{
    addModule(kComp);
    m_folder.write(temporaryPath(), QByteArray(100000, 'x'));
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(listed(), QStringList(kComp));
    EXPECT_FALSE(QFileInfo::exists(temporaryPath()));

    m_folder.write(temporaryPath() + "/x", "a folder in its place");
    addModule("New");
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(listed(), QStringList({kComp, "New"}));
}

TEST_F(CatalogueState, EarlierVersionsAreBroughtUpToDateWithoutLoadingAnything)
{
    for (const char *version : {"<Effects>", "<Effects version=\"1.0\">", "<Effects version=\"0.9\">"}) {
        SCOPED_TRACE(version);
        QFile::remove(cataloguePath());
        addListedModules({kComp});
        const QByteArray current = m_folder.catalogue();
        editCatalogue("<Effects version=\"1.1\">", version);
        editCatalogue("2020-01-02 03:04", "02.01.20 03:04:05");
        EXPECT_TRUE(run().succeeded());
        EXPECT_EQ(m_folder.catalogue(), current);
        EXPECT_EQ(loaded(), QStringList());
    }
}

TEST_F(CatalogueState, NothingNewLoadsNothingAndWritesNothing)
{
    addListedModules({kComp, "Delay"});
    m_folder.setModified(cataloguePath(), listedTime());
    const auto before = effectsFolder();
    const ScannerOutcome outcome = run();
    EXPECT_TRUE(outcome.succeeded());
    EXPECT_EQ(loaded(), QStringList());
    EXPECT_EQ(modified(), listedTime());
    EXPECT_EQ(effectsFolder(), before);
    EXPECT_EQ(logLines(outcome), QStringList());
}
