#include "Core/BaseLib/Files/NativeFile.h"

#include "Core/BaseLib/Files/win32/WindowsText.h"
#include "Tests/Core/BaseLib/Files/Fixtures.h"

#include <thread>

#include <gtest/gtest.h>

namespace {

/// Opens a file as indexers and the toolkit do: others may read and write it, but not delete it.
HANDLE hold(const QString &path)
{
    return CreateFileW(nativePath(path).c_str(), GENERIC_READ, FILE_SHARE_READ | FILE_SHARE_WRITE, nullptr,
                       OPEN_EXISTING, 0, nullptr);
}

} // namespace

TEST(HeldFile, IsReplacedOrDeletedWhenItsHolderLetsGo)
{
    const EmptyFolder folder;
    for (const bool replaces : {true, false}) {
        const QString file = folder.write("held"_q);
        const QString other = folder.write("new"_q);
        const HANDLE handle = hold(file);
        ASSERT_NE(handle, INVALID_HANDLE_VALUE);
        std::thread holder([handle] {
            Sleep(200);
            CloseHandle(handle);
        });
        EXPECT_TRUE(bool(replaces ? renameOver(other, file) : removeFile(file)));
        holder.join();
        EXPECT_EQ(QFile::exists(file), replaces);
    }
    EXPECT_TRUE(bool(removeFile(folder.path("gone"_q))));
    const HANDLE handle = hold(folder.write("held"_q));
    EXPECT_FALSE(removeFile(folder.path("held"_q)).reason.isEmpty()) << "not for ever";
    CloseHandle(handle);
}
