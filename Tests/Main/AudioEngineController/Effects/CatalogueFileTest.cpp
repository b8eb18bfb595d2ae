#include "Main/AudioEngineController/Effects/CatalogueFile.h"

#include "Main/AudioEngineController/Effects/MRLAudioPluginHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTCatalogue.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Catalogue.h"
#include "Tests/Support/QtPrinters.h"

#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace {

EffectRecord sampleRecord()
{
    EffectRecord record;
    record.path = QStringLiteral("/fx/Röhre & Co.vst3");
    record.fileTime = QStringLiteral("2024-02-29 23:59");
    record.name = QStringLiteral("A & B 真空管 🎛");
    record.id = QStringLiteral("0123456789ABCDEF0123456789ABCDEF");
    record.vendor = QStringLiteral("Müller");
    record.categories = QStringLiteral("Fx|EQ");
    record.inputs = 2;
    record.outputs = 6;
    record.category = 0x400; // EQ
    record.favourite = true;
    record.vstCategory = -3;
    record.width = 8;
    record.latency = 64;
    return record;
}

/// Line ends as the platform's text files have them.
QByteArray lines(QByteArray text) { return text.replace('\n', kLineEnd); }

class CatalogueReading : public ::testing::Test {
protected:
    CatalogueContents read(const CatalogueFormat &format, const QByteArray &text)
    {
        const QString path = m_folder.filePath(QStringLiteral("catalogue.xml"));
        EXPECT_TRUE(replaceFile(path, text, Durability::Buffered));
        return readCatalogueFile(format, path);
    }
    QTemporaryDir m_folder;
};

} // namespace

TEST(CatalogueText, Vst2WithSubEffect)
{
    EffectRecord record = sampleRecord();
    record.subName = QStringLiteral("Child");
    record.subId = 4294967295u;
    record.enabled = false;
    record.working = false;
    EXPECT_EQ(renderCatalogue(vstCatalogueFormat(), std::vector{record}),
              lines("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                    "<Effects version=\"1.4\">\n"
                    "\t<Effect>\n"
                    "\t\t<Path>/fx/Röhre & Co.vst3</Path>\n"
                    "\t\t<FileTime>2024-02-29 23:59</FileTime>\n"
                    "\t\t<Name>A & B 真空管 🎛</Name>\n"
                    "\t\t<ID>0123456789ABCDEF0123456789ABCDEF</ID>\n"
                    "\t\t<Category>-3</Category>\n"
                    "\t\t<CategoryMask>16</CategoryMask>\n"
                    "\t\t<Favourite>1</Favourite>\n"
                    "\t\t<Vendor>Müller</Vendor>\n"
                    "\t\t<Width>8</Width>\n"
                    "\t\t<Enabled>0</Enabled>\n"
                    "\t\t<Working>0</Working>\n"
                    "\t\t<SubEffect>\n"
                    "\t\t\t<Name>Child</Name>\n"
                    "\t\t\t<ID>4294967295</ID>\n"
                    "\t\t</SubEffect>\n"
                    "\t</Effect>\n"
                    "</Effects>\n"));
}

TEST(CatalogueText, Vst2WithoutSubEffectHasNoBlockForIt)
{
    EXPECT_FALSE(renderRecord(vstCatalogueFormat(), sampleRecord()).contains("SubEffect"));
}

TEST(CatalogueText, BuiltInEffects)
{
    EXPECT_EQ(renderCatalogue(builtInEffectsFormat(), std::vector{sampleRecord()}),
              lines("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                    "<Effects version=\"1.2\">\n"
                    "\t<Effect>\n"
                    "\t\t<ID>0123456789ABCDEF0123456789ABCDEF</ID>\n"
                    "\t\t<Favourite>1</Favourite>\n"
                    "\t\t<CategoryMask>16</CategoryMask>\n"
                    "\t</Effect>\n"
                    "</Effects>\n"));
}

TEST(CatalogueText, NoElementIsLeftOutForAnEmptyValue)
{
    const QByteArray text = renderRecord(vst3CatalogueFormat(), EffectRecord());
    for (const char *element : {"<Path></Path>", "<FileTime></FileTime>", "<Name></Name>", "<ID></ID>",
                                "<Categories></Categories>", "<Vendor></Vendor>", "<Inputs>-1</Inputs>"})
        EXPECT_TRUE(text.contains(element)) << element;
}

TEST_F(CatalogueReading, WhatWasWrittenComesBack)
{
    EffectRecord record = sampleRecord();
    record.subName = QStringLiteral(" ");
    record.subId = 0x80000001u;
    for (const CatalogueFormat *format : {&vst3CatalogueFormat(), &vstCatalogueFormat()}) {
        const QByteArray written = renderCatalogue(*format, std::vector{record});
        EXPECT_EQ(renderCatalogue(*format, read(*format, written).records), written);
    }
}

TEST_F(CatalogueReading, AbsentElementsKeepTheirDefaults)
{
    const CatalogueContents contents = read(
        vst3CatalogueFormat(), "<Effects version=\"1.1\"><Effect><Path>/a.vst3</Path></Effect></Effects>");
    ASSERT_EQ(contents.records.size(), 1u);
    const EffectRecord &record = contents.records.front();
    EXPECT_EQ(record.inputs, -1);
    EXPECT_TRUE(record.enabled);
    EXPECT_TRUE(record.working);
    EXPECT_FALSE(record.favourite);
    EXPECT_EQ(record.category, 0u);
}

TEST_F(CatalogueReading, ValuesThatAreNoNumbers)
{
    const CatalogueContents contents =
        read(vst3CatalogueFormat(),
             "<Effects version=\"1.1\"><Effect><Inputs> +7 junk</Inputs><Outputs>x</Outputs>"
             "<Enabled>2</Enabled><Working>no</Working></Effect></Effects>");
    const EffectRecord &record = contents.records.at(0);
    EXPECT_EQ(record.inputs, 7);
    EXPECT_EQ(record.outputs, 0);
    EXPECT_TRUE(record.enabled);
    EXPECT_FALSE(record.working);
}

TEST_F(CatalogueReading, Unusable)
{
    for (const char *text : {"<Effects version=\"1.4\"><Effect><Name>a<b</Name></Effect></Effects>",
                             "<Effects><Effect><Path>/a.so</Path></Effect></Effects>"}) {
        const CatalogueContents contents = read(vstCatalogueFormat(), text);
        EXPECT_FALSE(contents.reason.isEmpty()) << text;
        EXPECT_TRUE(contents.records.empty()) << text;
    }
    EXPECT_FALSE(readCatalogueFile(vstCatalogueFormat(), m_folder.path()).reason.isEmpty()) << "a folder";
}

TEST_F(CatalogueReading, EarlierVersionsAreUpgraded)
{
    QTemporaryDir folder;
    const QString plugin = folder.filePath(QStringLiteral("Old.vst3"));
    ASSERT_TRUE(replaceFile(plugin, "x", Durability::Buffered));
    const QString now = vst3CatalogueFormat().fileTime(plugin);
    const QString stored = QStringLiteral("some other form");
    const struct {
        const char *name;
        const CatalogueFormat &format;
        const char *version;
        bool keepsTime;
        bool keepsMask;
    } rows[] = {
        {"VST 3 without a version", vst3CatalogueFormat(), "", false, true},
        {"VST 3 1.0", vst3CatalogueFormat(), " version=\"1.0\"", false, true},
        {"VST 3 1.1", vst3CatalogueFormat(), " version=\"1.1\"", true, true},
        {"VST 2 1.2", vstCatalogueFormat(), " version=\"1.2\"", false, false},
        {"VST 2 1.3", vstCatalogueFormat(), " version=\"1.3\"", false, true},
        {"VST 2 1.4", vstCatalogueFormat(), " version=\"1.4\"", true, true},
    };
    for (const auto &row : rows) {
        const CatalogueContents contents =
            read(row.format, QByteArray("<Effects") + row.version + "><Effect><Path>" + plugin.toUtf8() +
                                 "</Path><FileTime>" + stored.toUtf8() +
                                 "</FileTime><CategoryMask>2</CategoryMask></Effect></Effects>");
        ASSERT_EQ(contents.records.size(), 1u) << row.name;
        EXPECT_EQ(contents.records[0].fileTime, row.keepsTime ? stored : now) << row.name;
        EXPECT_EQ(contents.records[0].category, row.keepsMask ? 0x10u : 0u) << row.name;
        EXPECT_EQ(contents.upgraded, !row.keepsTime) << row.name;
    }
}
