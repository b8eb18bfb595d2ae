#include "Core/BaseLib/Binary/PagedFile.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"

#include <gtest/gtest.h>

TEST(PagedFile, ReadsAsMemoryDoesAlsoAcrossPagesAndAtTheEnd)
{
    QByteArray content;
    for (int number = 0; content.size() < 10000; ++number)
        content += "text " + QByteArray::number(number) + '\0';
    const EmptyFolder folder;
    PagedFile file(folder.write("残響.so"_q, content));
    const ByteView onDisk = file.content();
    const ByteView inMemory(reinterpret_cast<const uchar *>(content.constData()), quint64(content.size()));
    ASSERT_EQ(onDisk.size(), inMemory.size());
    for (quint64 place = 0; place < inMemory.size() + 2; ++place) {
        const std::optional<QByteArray> text = inMemory.text(place, 100);
        ASSERT_EQ(onDisk.text(place, 100), text) << place;
        ASSERT_EQ(onDisk.from(place).item<quint64>(0), inMemory.from(place).item<quint64>(0)) << place;
        ASSERT_EQ(text && onDisk.holdsText(place, *text), text.has_value()) << place;
    }
    ASSERT_TRUE(QFile::resize(folder.path("残響.so"_q), 10));
    PagedFile shrunk(folder.path("残響.so"_q));
    const ByteView stale = shrunk.content();
    ASSERT_TRUE(QFile::resize(folder.path("残響.so"_q), 5));
    EXPECT_TRUE(stale.item<quint32>(0) && !stale.item<quint64>(0)) << "what is lost cannot be read";
    EXPECT_TRUE(PagedFile(folder.path()).content().isEmpty()) << "a folder";
    EXPECT_TRUE(PagedFile(folder.path("none"_q)).content().isEmpty());
}
