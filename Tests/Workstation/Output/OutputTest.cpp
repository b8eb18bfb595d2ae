#include "Workstation/Output/SummaryOutput.h"
#include "Workstation/Output/Terminal.h"

#include <gtest/gtest.h>

TEST(Output, CellsHaveTheirWidthInColumns)
{
    const struct {
        const char *text;
        int columns;
        const char *cell;
    } rows[] = {
        {"abc", 5, "abc  "},
        {"abcdef", 5, "abcd…"},
        {"日本語", 6, "日本語"},
        {"日本語", 5, "日本…"},
        {"日本語", 4, "日… "}, // half a character has no place
        {"e\xCC\x81", 2, "e\xCC\x81 "},
        {"🎹", 3, "🎹 "},
    };
    for (const auto &row : rows)
        EXPECT_EQ(Terminal::cell(row.text, row.columns), row.cell) << row.text;
}

TEST(Output, NothingInATextSteersTheTerminal)
{
    EXPECT_EQ(Terminal::harmless("a\x1b[2Jb\nc\xC2\x9B"
                                 "d\xE2\x80\xAE"
                                 "e\xE2\x81\xA6"),
              "a?[2Jb?c?d?e?");
    EXPECT_EQ(Terminal::harmless("Ünï 🎹 日本"), "Ünï 🎹 日本");
}

TEST(Output, CsvFieldsAreQuotedWhereTheyMustBeAndAreNoFormulas)
{
    CataloguedPlugin plugin{&pluginFormats().front(), {}, {}, false, false, 2};
    plugin.record.name = "A \"B\", C";
    plugin.record.vendor = "two\nlines";
    plugin.record.categories = "=1|Fx";
    plugin.record.id = "-1,2";
    plugin.record.path = "/p/A.vst3";
    ScanSummary summary;
    summary.plugins.push_back(plugin);
    const QByteArray csv = renderCsv(summary);
    EXPECT_EQ(csv.mid(csv.indexOf("\r\n") + 2),
              "vst3,\"A \"\"B\"\", C\",\"two\nlines\",'=1;Fx,2,,ok,,\"'-1,2\",/p/A.vst3,\r\n");
}

TEST(Output, ColumnsThatDoNotFitAreLeftOutOrCut)
{
    ScanSummary summary;
    summary.plugins.push_back({&pluginFormats().front(), {}, {}, false, false, 2, 2});
    EffectRecord &record = summary.plugins.front().record;
    record.name = "A name of twenty-two c";
    record.vendor = "Vendor of twenty-two c";
    record.categories = "Fx|Reverb";
    const struct {
        int width;
        const char *line;
    } rows[] = {
        {0, "VST 3   A name of twenty-two c  Vendor of twenty-two c  Fx, Reverb  2/2     ok"},
        {81, "VST 3   A name of twenty-two c  Vendor of twenty-two c  Fx, Reverb  2/2     ok"},
        {80, "VST 3   A name of twenty-two c  Vendor of twenty-two c  Fx, Reverb  ok"},
        {72, "VST 3   A name of twenty-two c  Vendor of twenty-two c  ok"},
        {60, "VST 3   A name of twenty-two c  Vendor of twenty-two…  ok"},
        {41, "VST 3   A name of twent…  Vendor …  ok"},
        {40, "VST 3   A name of twenty-two c  ok"},
        {20, "VST 3   A na…  ok"},
        {10, "VST 3   …  ok"},
    };
    for (const auto &row : rows)
        EXPECT_EQ(renderTable(summary, row.width).section('\n', 1, 1), row.line) << row.width;
}
