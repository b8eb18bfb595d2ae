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
constexpr char kVst2File[] = "FXConfiguration.xml";

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

TEST_F(HostFolder, MarkersOfTheSpecialShells)
{
    write("WaveShell1-VST3.scan3", markerText("/fx/WaveShell1-VST3.vst3", "WaveShell1-VST3"));
    VST3Host host;
    prepare(host);
    host.ReadCatalogue();
    EXPECT_TRUE(host.known().isEmpty());
    EXPECT_TRUE(host.isLeftAlone(QStringLiteral("/fx/WaveShell1-VST3.vst3")));
    host.ReadCatalogue();
    EXPECT_TRUE(host.isLeftAlone(QStringLiteral("/fx/WaveShell1-VST3.vst3")))
        << "until a scan came to its end";
    host.releaseHeldMarkers();
    EXPECT_FALSE(QFile::exists(pathOf("WaveShell1-VST3.scan3")));
    host.ReadCatalogue();
    EXPECT_FALSE(host.isLeftAlone(QStringLiteral("/fx/WaveShell1-VST3.vst3")))
        << "only in the run that absorbed it";
}

TEST_F(HostFolder, AChildsMarkerLeavesItsSiblingsAlone)
{
    const auto child = [](const char *id) {
        return QByteArray("<SubEffect><Name>C</Name><ID>") + id + "</ID></SubEffect>";
    };
    write(kVst2File, "<Effects version=\"1.4\">" + effect("/fx/S.so", "a", child("1")) +
                         effect("/fx/S.so", "b", child("2")) + "</Effects>");
    write("S.scan", markerText("/fx/S.so", "S"));
    write("C.scan", markerText("/fx/S.so", "C", "<SubID>2</SubID>"));
    VSTHost host;
    prepare(host);
    host.ReadCatalogue();
    const auto records = host.known().recordsOfPath(QStringLiteral("/fx/S.so"));
    ASSERT_EQ(records.size(), 2u);
    EXPECT_EQ(records[0]->id, QStringLiteral("a"));
    EXPECT_TRUE(records[0]->enabled);
    EXPECT_EQ(records[1]->id, QStringLiteral("C"));
    EXPECT_FALSE(records[1]->working);
    EXPECT_TRUE(QDir(m_folder.path()).entryList({QStringLiteral("*.scan")}).isEmpty());
}

TEST_F(HostFolder, CrashRecordsOfOneNameDoNotShutEachOtherOut)
{
    write("X.scan3", markerText("/one/X.vst3", "X"));
    VST3Host host;
    prepare(host);
    host.ReadCatalogue();
    write("X.scan3", markerText("/two/X.vst3", "X"));
    VST3Host next;
    prepare(next);
    next.ReadCatalogue();
    next.refillEffects();
    QStringList ids;
    for (const EffectRecord &record : next.effects())
        ids.append(record.id);
    // The first file is gone, so its record went along with the name: one plug-in, moved.
    EXPECT_EQ(ids, QStringList(QStringLiteral("X")));

    write("X.vst3", "x");
    write(kVst3File, "<Effects version=\"1.1\">" + effect(pathOf("X.vst3").toUtf8(), "X") + "</Effects>");
    write("X.scan3", markerText("/two/X.vst3", "X"));
    next.ReadCatalogue();
    next.refillEffects();
    ids.clear();
    for (const EffectRecord &record : next.effects())
        ids.append(record.id);
    EXPECT_EQ(ids, QStringList({QStringLiteral("/two/X.vst3"), QStringLiteral("X")}));
}

TEST_F(HostFolder, UnusableCataloguesCountAsEmpty)
{
    for (const char *text : {"", "<Effects version=\"1.1\"><Effect>", "<Other/>"}) {
        const CapturedLog log;
        write(kVst3File, text);
        VST3Host host;
        prepare(host);
        host.ReadCatalogue();
        EXPECT_TRUE(host.known().isEmpty()) << text;
        EXPECT_TRUE(log.contains(QStringLiteral("Cannot use the catalogue"))) << text;
    }
}

TEST_F(HostFolder, AnotherPluginsNameLosesNoCrash)
{
    const CapturedLog log;
    VST3Host host;
    prepare(host);
    EffectRecord healthy;
    healthy.path = QStringLiteral("/fx/a<b.vst3");
    healthy.id = healthy.name = QStringLiteral("a<b");
    EffectRecord killer;
    killer.path = QStringLiteral("/fx/Röhre & <Co>.vst3");
    killer.id = killer.name = QStringLiteral("Röhre & <Co>");
    killer.fileTime = QStringLiteral("t");
    killer.enabled = killer.working = false;
    host.AddEffect(healthy);
    host.AddEffect(killer);
    host.WriteCatalogue();
    host.ReadCatalogue();
    ASSERT_EQ(host.known().size(), 1u);
    const EffectRecord &known = *host.known().all().front();
    EXPECT_EQ(known.path, killer.path);
    EXPECT_EQ(known.name, killer.name);
    EXPECT_EQ(known.fileTime, killer.fileTime);
    EXPECT_TRUE(known.isCrashedFile());
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

TEST_F(HostFolder, ReadingAgainStartsFromNothing)
{
    write(kVst3File, "<Effects version=\"1.1\">" + effect("/a.vst3", "1") + "</Effects>");
    VST3Host host;
    prepare(host);
    host.ReadCatalogue();
    write(kVst3File, "<Effects version=\"1.1\"></Effects>");
    host.ReadCatalogue();
    EXPECT_TRUE(host.known().isEmpty());
}

TEST_F(HostFolder, CatalogueChangesAreSeenOnceInBothFormats)
{
    VST3Host vst3;
    VSTHost vst2;
    for (auto [host, file] : {std::pair<AudioPluginHost *, const char *>(&vst3, kVst3File),
                              std::pair<AudioPluginHost *, const char *>(&vst2, kVst2File)}) {
        prepare(*host);
        EXPECT_FALSE(host->catalogueChanged()) << file << ": not there";
        write(file, "one");
        EXPECT_TRUE(host->catalogueChanged()) << file;
        EXPECT_FALSE(host->catalogueChanged()) << file;
        write(file, "three");
        EXPECT_TRUE(host->catalogueChanged()) << file << ": another size";
    }
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
