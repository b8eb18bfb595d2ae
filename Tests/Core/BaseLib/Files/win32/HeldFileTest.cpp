#include "Core/BaseLib/Files/NativeFile.h"
#include "Core/BaseLib/Files/win32/WindowsHandle.h"
#include "Core/BaseLib/Files/win32/WindowsText.h"

#include "Tests/Support/TestFolder.h"

#include <QElapsedTimer>
#include <QFile>

#include <gtest/gtest.h>

TEST(HeldFile, IsTriedForAWhileAndThenReported)
{
    const TestFolder folder;
    folder.write("held", "");
    folder.write("new", "");
    for (const bool replaces : {true, false}) {
        const auto change = [&] {
            return replaces ? renameOver(folder.path("new"), folder.path("held"))
                            : removeFile(folder.path("held"));
        };
        {
            // As indexers open it: others may read and write it, but not delete it.
            const WindowsHandle holder(CreateFileW(nativePath(folder.path("held")).c_str(), GENERIC_READ,
                                                   FILE_SHARE_READ | FILE_SHARE_WRITE, nullptr, OPEN_EXISTING,
                                                   0, nullptr));
            ASSERT_TRUE(holder.isValid());
            QElapsedTimer timer;
            timer.start();
            EXPECT_FALSE(change().reason.isEmpty());
            EXPECT_GE(timer.elapsed(), 500) << "readers hold a file for moments";
        }
        EXPECT_TRUE(bool(change()));
        EXPECT_EQ(QFile::exists(folder.path("held")), replaces);
    }
    EXPECT_TRUE(bool(removeFile(folder.path("gone"))));
}
