#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QDir>
#include <QFile>

namespace {

const char kIdA[] = "id 0000000000000000000000000000000A\n";
const char kIdB[] = "id 0000000000000000000000000000000B\n";
const char kIdC[] = "id 0000000000000000000000000000000C\n";

QByteArray classText(const char *name, const char *id, const char *more = "")
{
    return QByteArray("class \"") + name + "\"\n" + id + more;
}

} // namespace

// Each module is a case of its own; they share the runs.
TEST_F(VST3ScanBench, UnchangedModulesAreNotLoadedAgain)
{
    const QDateTime epoch = QDateTime::fromSecsSinceEpoch(0);
    const struct {
        const char *name;
        QDateTime before;
        QDateTime after;
        bool probedAgain;
    } cases[] = {
        {"a same time", {{2020, 1, 1}, {10, 0, 5}}, {{2020, 1, 1}, {10, 0, 5}}, false},
        {"b seconds later", {{2020, 1, 1}, {10, 0, 0}}, {{2020, 1, 1}, {10, 0, 59}}, false},
        {"c next minute", {{2020, 1, 1}, {10, 0, 59}}, {{2020, 1, 1}, {10, 1, 0}}, true},
        {"d later", {{2020, 1, 1}, {10, 0}}, {{2021, 1, 1}, {10, 0}}, true},
        {"e earlier", {{2020, 1, 1}, {10, 0}}, {{2019, 1, 1}, {10, 0}}, true},
        {"f in the future", {{2099, 1, 1}, {10, 0}}, {{2099, 1, 1}, {10, 0}}, false},
        {"g back from the future", {{2099, 1, 1}, {10, 0}}, {{2020, 1, 1}, {10, 0}}, true},
        {"h the epoch itself", epoch, epoch, false},
        {"i since the epoch", epoch, epoch.addSecs(60), true},
        {"j before the epoch", epoch.addDays(-1), epoch.addDays(-1), false},
    };
    for (const auto &row : cases)
        m_folder.setModified(add(QLatin1String(row.name)), row.before);
    scan();
    EXPECT_EQ(loaded().size(), static_cast<int>(std::size(cases)));
    QStringList expected;
    QStringList stamps;
    for (const auto &row : cases) {
        m_folder.setModified(modulePath(QLatin1String(row.name)), row.after);
        stamps.append(QLatin1String(row.name) + row.after.toString(QStringLiteral("|yyyy-MM-dd hh:mm")));
        if (row.probedAgain)
            expected.append(QLatin1String(row.name));
    }
    scan();
    EXPECT_EQ(loaded(), expected);
    QStringList found = sortedRecords("Name FileTime");
    EXPECT_EQ(found, stamps);
}

TEST_F(VST3ScanBench, AnUpdateKeepsTheUsersMarks)
{
    add(QStringLiteral("Comp"),
        classText("Liked", kIdA, "subcategories Fx|EQ\n") + classText("Off", kIdB) + classText("Gone", kIdC));
    add(QStringLiteral("Other"));
    scan();
    mark(QStringLiteral("Liked"), "Favourite", "1");
    mark(QStringLiteral("Liked"), "CategoryMask", "16384");
    mark(QStringLiteral("Off"), "Enabled", "0");
    update(QStringLiteral("Comp"),
           classText("New", "id 00000000000000000000000000000001\n", "subcategories Fx|EQ\n") +
               classText("Renamed", kIdA, "vendor V\nsubcategories Fx|EQ\n") + classText("Off", kIdB));
    scan();
    EXPECT_EQ(loaded(), texts({"Comp"}));
    EXPECT_EQ(records("ID Name FileTime CategoryMask Favourite Enabled Working Vendor").mid(0, 3),
              texts({"00000000000000000000000000000001|New|2022-03-04 05:06|16|0|1|1|Fixture Works",
                     "0000000000000000000000000000000A|Renamed|2022-03-04 05:06|16384|1|1|1|V",
                     "0000000000000000000000000000000B|Off|2022-03-04 05:06|0|0|0|1|Fixture Works"}));
    EXPECT_EQ(records("Name").size(), 4);
}

TEST_F(VST3ScanBench, ASwitchedOffModuleIsNotLoadedWhenItChanges)
{
    add(QStringLiteral("Comp"), classText("Comp", kIdA));
    scan();
    mark(QStringLiteral("Comp"), "Enabled", "0");
    const QByteArray catalogue = m_folder.catalogue();
    update(QStringLiteral("Comp"), classText("Changed", kIdA));
    scan();
    EXPECT_EQ(loaded(), QStringList());
    EXPECT_EQ(m_folder.catalogue(), catalogue);
}

TEST_F(VST3ScanBench, AModuleThatFailsForAWhileKeepsItsMarks)
{
    add(QStringLiteral("Comp"), classText("Comp class", kIdA));
    scan();
    mark(QStringLiteral("Comp class"), "Favourite", "1");
    mark(QStringLiteral("Comp class"), "CategoryMask", "16384");
    update(QStringLiteral("Comp"), "answer module-entry false\n");
    scan();
    const char *elements = "Name ID CategoryMask Favourite Enabled Working";
    EXPECT_EQ(records(elements), texts({"Comp|Comp|16384|1|1|0"}));
    add(QStringLiteral("Comp"), classText("Comp class", kIdA));
    scan();
    EXPECT_EQ(records(elements), texts({"Comp class|0000000000000000000000000000000A|16384|1|1|1"}));
}

TEST_F(VST3ScanBench, AModuleThatMovesIsProbedAgainWithItsMarks)
{
    add(QStringLiteral("old/Comp"), classText("Comp", kIdA));
    add(QStringLiteral("Stays"));
    scan();
    mark(QStringLiteral("Comp"), "Favourite", "1");
    const QString moved = add(QStringLiteral("new/Comp"), classText("Comp", kIdA));
    ASSERT_TRUE(QDir(m_folder.path(QStringLiteral("Plugins/old"))).removeRecursively());
    scan();
    EXPECT_EQ(loaded(), texts({"Comp"}));
    EXPECT_TRUE(
        records("Name Path Favourite").contains(QStringLiteral("Comp|") + moved + QStringLiteral("|1")));
    EXPECT_EQ(records("Name").size(), 2);
    scan();
    EXPECT_EQ(loaded(), QStringList());
}

TEST_F(VST3ScanBench, RemovedModulesLeaveTheCatalogue)
{
    for (const char *name : {"Comp", "Delay", "Reverb"})
        add(QLatin1String(name));
    scan();
    ASSERT_TRUE(QFile::remove(modulePath(QStringLiteral("Delay"))));
    scan();
    EXPECT_EQ(loaded(), QStringList());
    QStringList found = sortedRecords("Name");
    EXPECT_EQ(found, texts({"Comp", "Reverb"}));
    // One goes, one comes.
    ASSERT_TRUE(QFile::remove(modulePath(QStringLiteral("Comp"))));
    add(QStringLiteral("Tuner"));
    scan();
    found = sortedRecords("Name");
    EXPECT_EQ(found, texts({"Reverb", "Tuner"}));
}
