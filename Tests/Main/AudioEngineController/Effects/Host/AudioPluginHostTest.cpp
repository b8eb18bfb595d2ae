#include "Main/AudioEngineController/Effects/Host/AudioPluginHost.h"

#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Host.h"
#include "Tests/Support/TestFolder.h"

#include <QDir>

#include <gtest/gtest.h>

#include <memory>

namespace {

class HostFolder : public testing::Test {
protected:
    /// A host that has read the folder.
    template <typename Host>
    std::unique_ptr<Host> readingHost()
    {
        auto host = std::make_unique<Host>();
        host->setCatalogueFolder(m_folder.effects());
        host->ReadCatalogue();
        return host;
    }
    void writeMarker(const char *file, const char *path, const char *name) const
    {
        m_folder.write(QLatin1String("Effects/") + file, QByteArray("<CrashedPlugin><Path>") + path +
                                                             "</Path><Created>t2</Created><Name>" + name +
                                                             "</Name></CrashedPlugin>");
    }

    TestFolder m_folder;
};

} // namespace

TEST_F(HostFolder, AbsorbedMarkersAreInTheCatalogueBeforeTheyGo)
{
    m_folder.write(
        "Effects/VST3Configuration.xml",
        "<Effects version=\"1.1\"><Effect><Path>/fx/A.vst3</Path><ID>1</ID><Favourite>1</Favourite>"
        "</Effect><Effect><Path>/fx/A.vst3</Path><ID>2</ID></Effect></Effects>");
    writeMarker("A.scan3", "/fx/A.vst3", "A");
    writeMarker("other.scan", "/fx/B.so", "B");
    const auto host = readingHost<VST3Host>();
    EXPECT_EQ(m_folder.markers(), QStringList("other.scan")) << "the other format's";
    const auto records = host->known().recordsOfPath("/fx/A.vst3");
    ASSERT_EQ(records.size(), 2u);
    EXPECT_EQ(records[0]->id, "A");
    EXPECT_EQ(records[0]->fileTime, "t2");
    EXPECT_TRUE(records[0]->isCrashedFile());
    EXPECT_TRUE(records[0]->favourite) << "the user's mark stays";
    EXPECT_TRUE(records[1]->enabled);
    EXPECT_TRUE(readingHost<VST3Host>()->known().recordsOfPath("/fx/A.vst3")[0]->isCrashedFile())
        << "another crash loses nothing";
}

TEST_F(HostFolder, MarkersStayWhenTheCatalogueCannotBeWritten)
{
    ASSERT_TRUE(QDir(m_folder.effects()).mkdir("VST3Configuration.xml"));
    writeMarker("A.scan3", "/fx/A.vst3", "A");
    EXPECT_EQ(readingHost<VST3Host>()->known().size(), 1u);
    EXPECT_EQ(m_folder.markers(), QStringList("A.scan3"));
}

TEST_F(HostFolder, WhatAMarkerSaysLittleOf)
{
    writeMarker("_.scan", "/fx/x64.so", "");
    const auto nameless = readingHost<VSTHost>();
    nameless->refillEffects();
    ASSERT_EQ(nameless->effects().size(), 1u);
    EXPECT_EQ(nameless->effects().front().id, "/fx/x64.so");

    m_folder.write("Effects/bad.scan3", "<CrashedPlugin><Path>/x");
    const auto unreadable = readingHost<VST3Host>();
    EXPECT_EQ(m_folder.markers(), QStringList());
    ASSERT_EQ(unreadable->known().size(), 1u);
    EXPECT_TRUE(unreadable->known().all()[0]->id.isEmpty());
    unreadable->refillEffects();
    EXPECT_TRUE(unreadable->effects().empty());
    EXPECT_FALSE(m_folder.catalogue().contains("<Effect>"));
}

TEST_F(HostFolder, ACulpritWhoseEveryIdentifierIsHeldGetsANumberedOne)
{
    m_folder.write("other/A.vst3", "a namesake that is there, with the identifiers of a liar");
    QByteArray records;
    for (const char *id : {"A", "/fx/A.vst3", "/fx/A.vst3:0", "/fx/A.vst3:0:2"})
        records += "<Effect><Path>" + m_folder.path("other/A.vst3").toUtf8() + "</Path><ID>" + id +
                   "</ID><Name>" + id + "</Name></Effect>";
    m_folder.write("Effects/VST3Configuration.xml", "<Effects version=\"1.1\">" + records + "</Effects>");
    writeMarker("A.scan3", "/fx/A.vst3", "A");
    readingHost<VST3Host>();
    const auto host = readingHost<VST3Host>(); // knows what the catalogue says now
    const auto culprit = host->known().recordsOfPath("/fx/A.vst3");
    ASSERT_EQ(culprit.size(), 1u);
    EXPECT_EQ(culprit[0]->id, "/fx/A.vst3:0:3");
}

TEST_F(HostFolder, WaitingRecordsStandBetweenTheOthersInOrder)
{
    const auto host = readingHost<VST3Host>();
    EffectRecord record;
    record.path = "/p.vst3";
    WaitingRecords waiting;
    for (const char *id : {"A", "B", "C", "D", "E"}) {
        record.id = record.name = id;
        if (*id % 2 == 0)
            host->AddEffect(record);
        else
            waiting.insert({record.id, {record, {}}});
    }
    host->WriteCatalogue(waiting, Durability::Buffered);
    QString ids;
    for (const EffectRecord &back :
         readCatalogueFile(vst3CatalogueFormat(), m_folder.effects() + "/VST3Configuration.xml").records)
        ids += back.id;
    EXPECT_EQ(ids, "ABCDE");
}
