#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QFile>

namespace {

using VST3Merge = VST3ScanBench;

const QByteArray kIdA = "id 0000000000000000000000000000000A\n";
const QByteArray kIdB = "id 0000000000000000000000000000000B\n";

} // namespace

// Each module is a case of its own; they share the runs.
TEST_F(VST3Merge, UnchangedModulesAreNotLoadedAgain)
{
    const QDateTime epoch = QDateTime::fromSecsSinceEpoch(0);
    const struct {
        const char *name;
        QDateTime before, after;
        bool probedAgain;
    } cases[] = {
        {"a seconds later", {{2020, 1, 1}, {10, 0, 0}}, {{2020, 1, 1}, {10, 0, 59}}, false},
        {"b next minute", {{2020, 1, 1}, {10, 0, 59}}, {{2020, 1, 1}, {10, 1, 0}}, true},
        {"c earlier", {{2020, 1, 1}, {10, 0}}, {{2019, 1, 1}, {10, 0}}, true},
        {"d back from the future", {{2099, 1, 1}, {10, 0}}, {{2020, 1, 1}, {10, 0}}, true},
        {"e since the epoch", epoch, epoch.addSecs(60), true},
        {"f before the epoch", epoch.addDays(-1), epoch.addDays(-1), false},
    };
    for (const auto &row : cases)
        m_folder.setModified(add(row.name), row.before);
    scan();
    EXPECT_EQ(loaded().size(), static_cast<int>(std::size(cases)));
    QStringList expected, stamps;
    for (const auto &row : cases) {
        m_folder.setModified(modulePath(row.name), row.after);
        stamps.append(row.name + row.after.toString("|yyyy-MM-dd hh:mm"));
        if (row.probedAgain)
            expected.append(row.name);
    }
    scan();
    EXPECT_EQ(loaded(), expected);
    EXPECT_EQ(sortedRecords("Name FileTime"), stamps);
}

TEST_F(VST3Merge, AnUpdateKeepsTheUsersMarks)
{
    add("Comp", "class Liked\n" + kIdA + "subcategories Fx|EQ\nclass Off\n" + kIdB + "class Gone\n");
    add("Other");
    scan();
    mark("Liked", "Favourite", "1");
    mark("Liked", "CategoryMask", "16384");
    mark("Off", "Enabled", "0");
    update("Comp", "class New\nid 00000000000000000000000000000001\nsubcategories Fx|EQ\nclass Renamed\n" +
                       kIdA + "vendor V\nsubcategories Fx|EQ\nclass Off\n" + kIdB);
    scan();
    EXPECT_EQ(loaded(), texts({"Comp"}));
    EXPECT_EQ(records("ID Name FileTime CategoryMask Favourite Enabled Working Vendor").mid(0, 3),
              texts({"00000000000000000000000000000001|New|2022-03-04 05:06|16|0|1|1|Fixture Works",
                     "0000000000000000000000000000000A|Renamed|2022-03-04 05:06|16384|1|1|1|V",
                     "0000000000000000000000000000000B|Off|2022-03-04 05:06|0|0|0|1|Fixture Works"}));
    EXPECT_EQ(records("Name").size(), 4);
}

TEST_F(VST3Merge, AModuleThatFailsForAWhileKeepsItsMarks)
{
    add("Comp", "class Liked\n" + kIdA);
    add("Off");
    scan();
    mark("Liked", "Favourite", "1");
    mark("Liked", "CategoryMask", "16384");
    mark("Off", "Enabled", "0");
    update("Comp", "answer module-entry false\n");
    update("Off", "class Changed\n");
    scan();
    EXPECT_EQ(loaded(), texts({"Comp"})) << "what is switched off is not probed";
    const char *elements = "Name CategoryMask Favourite Enabled Working FileTime";
    EXPECT_EQ(sortedRecords(elements),
              texts({"Comp|16384|1|1|0|2022-03-04 05:06", "Off|0|0|0|1|2021-03-04 05:06"}));
    add("Comp", "class Liked\n" + kIdA);
    scan();
    EXPECT_EQ(sortedRecords(elements),
              texts({"Liked|16384|1|1|1|2021-03-04 05:06", "Off|0|0|0|1|2021-03-04 05:06"}));
}

TEST_F(VST3Merge, AModuleThatMovesIsProbedAgainWithItsMarks)
{
    add("old/Comp", "class Comp\n" + kIdA);
    scan();
    mark("Comp", "Favourite", "1");
    ASSERT_TRUE(QFile::remove(modulePath("old/Comp")));
    const QString moved = add("new/Comp", "class Comp\n" + kIdA);
    scan();
    EXPECT_EQ(records("Name Path Favourite"), QStringList("Comp|" + moved + "|1"));
    expectSettled();
}
