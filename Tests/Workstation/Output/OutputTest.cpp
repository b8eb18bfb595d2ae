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

TEST(Output, CsvFieldsAreQuotedWhereTheyMustBe)
{
    CataloguedPlugin plugin{&pluginFormats().front(), {}, {}, false, false, 2};
    plugin.record.name = "A \"B\", C";
    plugin.record.vendor = "two\nlines";
    plugin.record.path = "/p/A.vst3";
    ScanSummary summary;
    summary.plugins.push_back(plugin);
    const QByteArray csv = renderCsv(summary);
    EXPECT_EQ(csv.mid(csv.indexOf("\r\n") + 2),
              "vst3,\"A \"\"B\"\", C\",\"two\nlines\",,2,,ok,,,/p/A.vst3,\r\n");
}
