#include "Core/BaseLib/Binary/win32/ImportSearch.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"

#include <gtest/gtest.h>

TEST(ImportSearch, FindsWhatWindowsFinds)
{
    const EmptyFolder folder;
    const QString beside = folder.write("Beside Ünï.dll"_q);
    const std::optional<QString> missing, known(QString{});
    const struct {
        const char *name;
        QString library;
        std::optional<QString> found;
        std::optional<QString> foundFromFolder;
    } rows[] = {
        {"loaded", "KERNEL32.dll"_q, known, known},
        {"the system's, not loaded", "OpenGL32.DLL"_q, known, known},
        {"one of the API sets", "api-ms-win-core-no-such-l1-1-0.dll"_q, known, known},
        {"by manifest", "MSVCR90.dll"_q, known, known},
        {"missing", "no-such-library.dll"_q, missing, missing},
        {"beside it", "Beside Ünï.dll"_q, missing, beside},
    };
    for (const auto &row : rows) {
        EXPECT_EQ(importSearch()(row.library), row.found) << row.name;
        EXPECT_EQ(importSearch(folder.path())(row.library), row.foundFromFolder) << row.name;
    }
    EXPECT_EQ(whyNotLoadable(QStringLiteral(ONE_FUNCTION_LIBRARY), importSearch()), QString());
}
