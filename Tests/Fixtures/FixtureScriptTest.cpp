#include "Tests/Fixtures/FixtureScript.h"

#include <gtest/gtest.h>

#include <cstdint>

TEST(FixtureScript, WordsAreSplitUnquotedAndUnescaped)
{
    const auto statements = parseScript("# a comment\r\n\n"
                                        "class \"Two Words\" # and a comment\n"
                                        "  name a\\xFF\\x00b \"\" \"say \\\"#\\\"\\n\"\n");
    ASSERT_EQ(statements.size(), 2u);
    EXPECT_EQ(statements[0].key, "class");
    EXPECT_EQ(statements[0].words, std::vector<std::string>{"Two Words"});
    EXPECT_EQ(statements[1].line, 4);
    EXPECT_EQ(statements[1].words, (std::vector<std::string>{std::string("a\xFF\0b", 4), "", "say \"#\"\n"}));
}

TEST(FixtureScript, NumbersHaveThirtyTwoBits)
{
    const struct {
        const char *text;
        std::int64_t value; // outside the range of 32 bits: refused
    } cases[] = {{"0", 0},
                 {"-2147483648", INT32_MIN},
                 {"2147483647", INT32_MAX},
                 {"0xFFFFFFFF", -1},
                 {"0x80004001", static_cast<std::int32_t>(0x80004001u)},
                 {"2147483648", INT64_MAX},
                 {"-2147483649", INT64_MAX},
                 {"0x100000000", INT64_MAX},
                 {"99999999999999999999", INT64_MAX},
                 {"12x", INT64_MAX},
                 {"", INT64_MAX}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.text);
        if (row.value == INT64_MAX)
            EXPECT_THROW(parseNumber(row.text), ScriptError);
        else
            EXPECT_EQ(parseNumber(row.text), row.value);
    }
}

TEST(FixtureScript, FaultyLinesAreNamed)
{
    for (const char *text :
         {"\nclass \"open", "\nclass \\q", "\nclass \\xG0", "\nclass \\x1", "\nclass \\"}) {
        SCOPED_TRACE(text);
        try {
            parseScript(text);
            ADD_FAILURE() << "not refused";
        } catch (const ScriptError &error) {
            EXPECT_EQ(std::string(error.what()).rfind("line 2", 0), 0u) << error.what();
        }
    }
}
