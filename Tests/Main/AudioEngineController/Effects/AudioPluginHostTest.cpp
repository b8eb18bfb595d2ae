#include "Main/AudioEngineController/Effects/AudioPluginHost.h"

#include "Main/AudioEngineController/Effects/CrashMarker.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Host.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/QtPrinters.h"

#include <QDir>
#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace {

/// A host on a folder of its own.
class HostFolder : public ::testing::Test {
protected:
    template <typename Host>
    void prepare(Host &host)
    {
        host.setCatalogueFolder(m_folder.path());
    }

    QString pathOf(const char *name) const { return m_folder.filePath(QString::fromUtf8(name)); }
    void write(const char *name, const QByteArray &text) const
    {
        ASSERT_TRUE(replaceFile(pathOf(name), text, Durability::Buffered));
    }
    QByteArray read(const char *name) const
    {
        QByteArray text;
        readWholeFile(pathOf(name), text);
        return text.replace(kLineEnd, "\n");
    }
    static QByteArray effect(const char *path, const char *id, const char *more = "")
    {
        return QByteArray("<Effect><Path>") + path + "</Path><FileTime>t</FileTime><Name>N</Name><ID>" + id +
               "</ID>" + more + "</Effect>";
    }
    static QByteArray markerText(const char *path, const char *name, const char *more = "")
    {
        return QByteArray("<CrashedPlugin><Path>") + path + "</Path><Created>t2</Created><Name>" + name +
               "</Name>" + more + "</CrashedPlugin>";
    }

    QTemporaryDir m_folder;
};

constexpr char kVst3File[] = "VST3Configuration.xml";

} // namespace

TEST_F(HostFolder, AbsorbedMarkersAreInTheCatalogueBeforeTheyGo)
{
    write(kVst3File, "<Effects version=\"1.1\">" + effect("/fx/A.vst3", "1", "<Favourite>1</Favourite>") +
                         effect("/fx/A.vst3", "2") + "</Effects>");
    write("A.scan3", markerText("/fx/A.vst3", "A"));
    write("other.scan", markerText("/fx/B.so", "B"));
    VST3Host host;
    prepare(host);
    host.ReadCatalogue();

    EXPECT_FALSE(QFile::exists(pathOf("A.scan3")));
    EXPECT_TRUE(QFile::exists(pathOf("other.scan"))) << "the other format's";
    const auto records = host.known().recordsOfPath(QStringLiteral("/fx/A.vst3"));
    ASSERT_EQ(records.size(), 2u);
    EXPECT_EQ(records[0]->id, QStringLiteral("A"));
    EXPECT_EQ(records[0]->fileTime, QStringLiteral("t2"));
    EXPECT_TRUE(records[0]->isCrashedFile());
    EXPECT_TRUE(records[0]->favourite) << "the user's mark stays";
    EXPECT_TRUE(records[1]->enabled);

    VST3Host second;
    prepare(second);
    second.ReadCatalogue();
    EXPECT_TRUE(second.known().recordsOfPath(QStringLiteral("/fx/A.vst3"))[0]->isCrashedFile())
        << "another crash loses nothing";
}

TEST_F(HostFolder, MarkersStayWhenTheCatalogueCannotBeWritten)
{
    const CapturedLog log;
    ASSERT_TRUE(QDir(m_folder.path()).mkdir(QString::fromLatin1(kVst3File)));
    write("A.scan3", markerText("/fx/A.vst3", "A"));
    VST3Host host;
    prepare(host);
    host.ReadCatalogue();
    EXPECT_EQ(host.known().size(), 1u);
    EXPECT_TRUE(QFile::exists(pathOf("A.scan3")));
    EXPECT_TRUE(log.contains(QStringLiteral("Cannot write the catalogue")));
}

TEST_F(HostFolder, ACrashedFileWithoutANameOfItsOwnIsRecorded)
{
    write("_.scan", markerText("/fx/x64.so", ""));
    VSTHost host;
    prepare(host);
    host.ReadCatalogue();
    host.refillEffects();
    ASSERT_EQ(host.effects().size(), 1u);
    EXPECT_EQ(host.effects().front().id, QStringLiteral("/fx/x64.so"));
}

TEST_F(HostFolder, AnUnreadableMarkerIsRemovedAndMakesNoEntry)
{
    const CapturedLog log;
    write("bad.scan3", "<CrashedPlugin><Path>/x");
    VST3Host host;
    prepare(host);
    host.ReadCatalogue();
    EXPECT_FALSE(QFile::exists(pathOf("bad.scan3")));
    EXPECT_EQ(host.known().size(), 1u);
    EXPECT_TRUE(host.known().all()[0]->id.isEmpty());
    host.refillEffects();
    EXPECT_TRUE(host.effects().empty());
    EXPECT_FALSE(read(kVst3File).contains("<Effect>"));
}

TEST_F(HostFolder, WaitingRecordsStandBetweenTheOthersInOrder)
{
    VST3Host host;
    prepare(host);
    EffectRecord record;
    record.path = QStringLiteral("/p.vst3");
    for (const char *id : {"B", "D"}) {
        record.id = record.name = QString::fromLatin1(id);
        host.AddEffect(record);
    }
    WaitingRecords waiting;
    for (const char *id : {"A", "C", "E"}) {
        record.id = record.name = QString::fromLatin1(id);
        waiting.insert({record.id, {record, {}}});
    }
    host.WriteCatalogue(waiting, Durability::Buffered);
    QStringList ids;
    for (const EffectRecord &back : readCatalogueFile(vst3CatalogueFormat(), pathOf(kVst3File)).records)
        ids.append(back.id);
    EXPECT_EQ(ids.join(QString()), QStringLiteral("ABCDE"));
}
