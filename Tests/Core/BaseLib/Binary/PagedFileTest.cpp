#include "Core/BaseLib/Binary/PagedFile.h"

#include "Tests/Support/TestFolder.h"

#include <gtest/gtest.h>

TEST(PagedFile, ReadsAsMemoryDoesAlsoAcrossPagesAndAtTheEnd)
{
    QByteArray content;
    for (int number = 0; content.size() < 10000; ++number)
        content += "text " + QByteArray::number(number) + '\0';
    const TestFolder folder;
    folder.write("残響.so", content);
    PagedFile file(folder.path("残響.so"));
    const ByteView onDisk = file.content();
    const ByteView inMemory(reinterpret_cast<const uchar *>(content.constData()), quint64(content.size()));
    for (quint64 place = 0; place < inMemory.size() + 2; ++place)
        ASSERT_EQ(onDisk.text(place, 100), inMemory.text(place, 100)) << place;
    PagedFile shrunk(folder.path("残響.so"));
    ASSERT_TRUE(QFile::resize(folder.path("残響.so"), 5));
    EXPECT_TRUE(shrunk.content().item<quint32>(0).has_value());
    EXPECT_FALSE(shrunk.content().item<quint64>(0).has_value()) << "what is gone cannot be read";
    EXPECT_TRUE(PagedFile(folder.plugins()).content().isEmpty()) << "a folder";
}
