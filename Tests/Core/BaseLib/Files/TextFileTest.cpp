#include "Core/BaseLib/Files/TextFile.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"

#include <gtest/gtest.h>

TEST(ReplaceFile, LeavesTheNewContentAndNothingElse)
{
    const QByteArray large(300000, 'x');
    const struct {
        const char *name;
        QByteArray before; ///< null: no file
        QByteArray content;
        Durability durability;
    } rows[] = {
        {"new file", QByteArray(), "<Effects>\n", Durability::Buffered},
        {"shorter than before", large, "short", Durability::Buffered},
        {"longer than before", "short", large, Durability::Synced},
        {"empty", "short", "", Durability::Buffered},
        {"bytes as they are", "x", QByteArray("\xE6\xAE\x8B\0\r\n\n", 7), Durability::Synced},
    };
    for (const auto &row : rows) {
        const EmptyFolder folder;
        if (!row.before.isNull())
            folder.write("残響.xml"_q, row.before);
        const FileResult result = replaceFile(folder.path("残響.xml"_q), row.content, row.durability);
        EXPECT_TRUE(result) << row.name << ": " << result.reason.toStdString();
        EXPECT_EQ(contentOf(folder.path("残響.xml"_q)), row.content) << row.name;
        EXPECT_EQ(folder.names(), QStringList("残響.xml"_q)) << row.name;
    }
}
