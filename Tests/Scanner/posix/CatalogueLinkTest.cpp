#include "Tests/Scanner/ScannerTest.h"

#include <QFile>
#include <QFileInfo>

namespace {

using CatalogueLink = ScannerTest;

} // namespace

TEST_F(CatalogueLink, StaysOne)
{
    addListedModules({QStringLiteral("Comp")});
    const QString target = m_folder.path(QStringLiteral("elsewhere.xml"));
    ASSERT_TRUE(QFile::rename(cataloguePath(), target));
    ASSERT_TRUE(QFile::link(target, cataloguePath()));
    addModule(QStringLiteral("New"));
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(QFileInfo(cataloguePath()).symLinkTarget(), target);
    EXPECT_EQ(m_folder.read(target).count("<Effect>"), 2);
    EXPECT_EQ(listed(), QStringList({QStringLiteral("Comp"), QStringLiteral("New")}));
}
