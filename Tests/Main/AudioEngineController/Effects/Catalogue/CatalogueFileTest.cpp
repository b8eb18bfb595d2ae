#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"

#include "Main/AudioEngineController/Effects/Catalogue/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"
#include "Tests/Support/QtPrinters.h"

#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace {

class CatalogueReading : public testing::Test {
protected:
    CatalogueContents read(const CatalogueFormat &format, const QByteArray &text)
    {
        const QString path = m_folder.filePath("catalogue.xml");
        EXPECT_TRUE(replaceFile(path, text, Durability::Buffered));
        return readCatalogueFile(format, path, [](const QString &module) { return "of " + module; });
    }
    QTemporaryDir m_folder;
};

} // namespace

TEST(CatalogueText, OfVst2)
{
    EffectRecord record;
    record.path = "/fx/Röhre & Co.vst3";
    record.fileTime = "2024-02-29 23:59";
    record.name = "A & B 真空管 🎛";
    record.id = "0123456789ABCDEF0123456789ABCDEF";
    record.vendor = "Müller";
    record.categories = "Fx|EQ";
    record.inputs = 2;
    record.outputs = 6;
    record.category = 0x400; // EQ
    record.favourite = true;
    record.vstCategory = -3;
    record.width = 8;
    record.latency = 64;
    record.subName = "Child";
    record.subId = 4294967295u;
    record.enabled = record.working = false;
    EXPECT_EQ(renderCatalogue(vstCatalogueFormat(), std::vector{record}).replace(kLineEnd, "\n"),
              "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
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
              "</Effects>\n");
    EXPECT_FALSE(renderRecord(vstCatalogueFormat(), EffectRecord()).contains("SubEffect"));
}

TEST_F(CatalogueReading, ValuesThatAreAbsentOrNoNumbers)
{
    const auto records = read(vst3CatalogueFormat(), R"(<Effects version="1.1"><Effect></Effect>
        <Effect><Inputs> +7 junk</Inputs><Outputs>x</Outputs><Enabled>2</Enabled><Working>no</Working></Effect>
        </Effects>)")
                             .records;
    ASSERT_EQ(records.size(), 2u);
    EXPECT_EQ(records[0].inputs, -1);
    EXPECT_EQ(records[0].category, 0u);
    EXPECT_TRUE(records[0].enabled && records[0].working && !records[0].favourite);
    EXPECT_EQ(records[1].inputs, 7);
    EXPECT_EQ(records[1].outputs, 0);
    EXPECT_TRUE(records[1].enabled && !records[1].working);
}

TEST_F(CatalogueReading, EarlierVersionsAreUpgraded)
{
    const struct {
        const CatalogueFormat &format;
        const char *version;
        bool keepsTime;
        quint32 mask;
    } rows[] = {
        {vst3CatalogueFormat(), "", false, 0x10},
        {vst3CatalogueFormat(), " version=\"1.0\"", false, 0x10},
        {vst3CatalogueFormat(), " version=\"1.1\"", true, 0x10},
        {vstCatalogueFormat(), " version=\"1.2\"", false, 0},
        {vstCatalogueFormat(), " version=\"1.3\"", false, 0x10},
        {vstCatalogueFormat(), " version=\"1.4\"", true, 0x10},
    };
    EXPECT_FALSE(read(vstCatalogueFormat(), "<Effects><Effect/></Effects>").reason.isEmpty())
        << "of a version before the first";
    for (const auto &row : rows) {
        SCOPED_TRACE(&row - rows);
        const CatalogueContents contents =
            read(row.format, QByteArray("<Effects") + row.version +
                                 "><Effect><Path>a</Path><FileTime>other</FileTime>"
                                 "<CategoryMask>2</CategoryMask></Effect></Effects>");
        ASSERT_EQ(contents.records.size(), 1u);
        EXPECT_EQ(contents.records[0].fileTime, row.keepsTime ? "other" : "of a");
        EXPECT_EQ(contents.records[0].category, row.mask);
    }
}
