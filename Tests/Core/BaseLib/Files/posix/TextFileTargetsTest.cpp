#include "Core/BaseLib/Files/TextFile.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"
#include "Tests/Core/BaseLib/Files/posix/OrdinaryUser.h"

#include <sys/stat.h>

#include <gtest/gtest.h>

namespace {

mode_t modeOf(const QByteArray &path)
{
    struct stat status = {};
    return stat(path.constData(), &status) == 0 ? status.st_mode : 0;
}

} // namespace

TEST(ReplaceFile, LinksPermissionsAndReadersStay)
{
    for (const mode_t mode : {0600U, 0640U, 0666U, 0755U}) {
        const EmptyFolder here;
        const EmptyFolder there;
        QFile reader(there.write("a.xml"_q, "old"));
        const QString link = here.path("link.xml"_q);
        chmod(there.nativePath("a.xml").constData(), mode);
        ASSERT_TRUE(QFile::link(reader.fileName(), link) && reader.open(QIODevice::ReadOnly));
        EXPECT_TRUE(replaceFile(link, "new", Durability::Buffered));
        EXPECT_EQ(QFile::symLinkTarget(link), reader.fileName());
        EXPECT_EQ(contentOf(reader.fileName()), "new");
        EXPECT_EQ(modeOf(there.nativePath("a.xml")) & 07777U, mode);
        EXPECT_EQ(reader.readAll(), "old") << "who has it open sees the old content whole";
        EXPECT_EQ(here.names() + there.names(), QStringList({"link.xml"_q, "a.xml"_q}));
    }
}

TEST(ReplaceFile, ObeysPermissions)
{
    const struct {
        const char *name;
        mode_t folder;
        mode_t file;
        bool replaced;
    } rows[] = {
        {"a folder that takes no temporary file", 0555, 0666, true},
        {"a file that is not to be written, in an open folder", 0777, 0444, false},
    };
    for (const auto &row : rows) {
        const EmptyFolder folder;
        const QString path = folder.write("a.xml"_q, "long old content");
        chmod(folder.nativePath("a.xml").constData(), row.file);
        chmod(folder.nativePath("").constData(), row.folder);
        EXPECT_TRUE(trueForOrdinaryUser([&] {
            return bool(replaceFile(path, "new", Durability::Buffered)) == row.replaced;
        })) << row.name;
        chmod(folder.nativePath("").constData(), 0755);
        EXPECT_EQ(contentOf(path), row.replaced ? "new" : "long old content") << row.name;
        EXPECT_EQ(folder.names(), QStringList("a.xml"_q)) << row.name;
    }
}
