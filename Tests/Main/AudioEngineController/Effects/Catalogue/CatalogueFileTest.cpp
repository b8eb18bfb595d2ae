#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"

#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/Catalogue/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"
#include "Tests/Support/QtPrinters.h"

#include <QDir>
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

TEST(CatalogueText, IsWrittenAsItWasRead)
{
    for (const PluginFormat which : {PluginFormat::Vst2, PluginFormat::Vst3, PluginFormat::Clap}) {
        const CatalogueFormat *const format = formatInfo(which).catalogue;
        const bool isVst2 = which == PluginFormat::Vst2;
        const QString path =
            QStringLiteral(FXPROBE_FUZZ_CORPUS "/catalogue/every-element-%1.xml").arg(formatInfo(which).key);
        QByteArray text;
        ASSERT_TRUE(bool(readWholeFile(path, text)));
        std::vector<EffectRecord> records = readCatalogueFile(*format, path).records;
        ASSERT_EQ(records.size(), 1u);
        if (which != PluginFormat::Clap) // for the one the inputs are written, for the other nothing
            records[0].outputs = records[0].latency = 7;
        EXPECT_EQ(renderCatalogue(*format, records), text.replace("\n", kLineEnd));
        EXPECT_EQ(records[0].category, 0x400u) << "EQ";
        EXPECT_TRUE(records[0].favourite && !records[0].enabled && records[0].working != isVst2);
        EXPECT_EQ(records[0].subId, isVst2 ? 4294967295u : 0u);
        EXPECT_EQ(records[0].vstCategory, isVst2 ? -3 : 0);
    }
    EXPECT_FALSE(renderRecord(vstCatalogueFormat(), EffectRecord()).contains("SubEffect"));
}

TEST_F(CatalogueReading, ValuesThatAreAbsentOrNoNumbers)
{
    const auto records = read(vst3CatalogueFormat(), R"(<Effects version="1.1"><Effect></Effect>
        <Effect><Inputs> +7 junk</Inputs><Outputs>x</Outputs><Enabled>2</Enabled><Working>no</Working></Effect>
        </Effects>)")
                             .records;
    const QByteArray path = QDir::toNativeSeparators("a/b").toUtf8(); // as other writers have it
    EXPECT_EQ(read(vst3CatalogueFormat(), "<Effects><Effect><Path>" + path + "</Path></Effect></Effects>")
                  .records.at(0)
                  .path,
              "a/b");
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
