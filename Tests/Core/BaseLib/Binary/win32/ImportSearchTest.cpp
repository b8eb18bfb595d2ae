#include "Core/BaseLib/Binary/win32/ImportSearch.h"

#include "Tests/Support/TestFolder.h"

#include <gtest/gtest.h>

TEST(ImportSearch, FindsWhatWindowsFinds)
{
    const TestFolder folder;
    folder.write("Beside Ünï.dll", "");
    const std::optional<QString> missing, known(QString{});
    const struct {
        const char *name;
        QString library;
        std::optional<QString> found, foundFromFolder;
    } rows[] = {
        {"loaded", "KERNEL32.dll", known, known},
        {"the system's, not loaded", "OpenGL32.DLL", known, known},
        {"one of the API sets", "api-ms-win-core-no-such-l1-1-0.dll", known, known},
        {"by manifest", "MSVCR90.dll", known, known},
        {"missing", "no-such-library.dll", missing, missing},
        {"beside it", "Beside Ünï.dll", missing, folder.path("Beside Ünï.dll")},
    };
    for (const auto &row : rows) {
        EXPECT_EQ(importSearch()(row.library, {}), row.found) << row.name;
        EXPECT_EQ(importSearch(folder.dataFolder())(row.library, {}), row.foundFromFolder) << row.name;
    }
}
