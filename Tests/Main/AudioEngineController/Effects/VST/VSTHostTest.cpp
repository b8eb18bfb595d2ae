#include "Main/AudioEngineController/Effects/VST/VSTHost.h"

#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Main/VLib/SimpleGUI.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/NotingUI.h"
#include "Tests/Support/TestApplication.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST2Fixture.h"

#include <gtest/gtest.h>

namespace {

class VSTHostTest : public testing::Test {
protected:
    VSTHostTest() { m_host.setCatalogueFolder(m_folder.effects()); }

    TestFolder m_folder;
    const CapturedLog m_log;
    VSTHost m_host;
};

} // namespace

TEST_F(VSTHostTest, ARefreshCleansNamesUp)
{
    QByteArray text;
    for (const char *name : {"Comp [2.4]", "EQ [2.4] old [2.4]", "Gate[2.4]", "Comp"})
        text += QByteArray("<Effect><Path>/fx/D.so</Path><Name>") + name + "</Name><ID>" + name +
                "</ID></Effect>";
    m_folder.write("Effects/FXConfiguration.xml", "<Effects version=\"1.4\">" + text + "</Effects>");
    for (const bool isFirst : {true, false}) {
        m_host.ReadCatalogue();
        EXPECT_EQ(m_host.Scan(false, true), isFirst) << "clean afterwards";
        QStringList names;
        for (const EffectRecord &record : m_host.effects())
            names.append(record.name);
        EXPECT_EQ(names, QStringList({"Comp", "D", "EQ", "Gate[2.4]"})) << "no name twice";
    }
}

TEST_F(VSTHostTest, AShellLeavesTheProgressToTheFilesAgain)
{
    addVST2File(m_folder.plugins(), "a Shell", "child 11 A\nchild 12 B\nanswer entry null B\n");
    addVST2File(m_folder.plugins(), "b Comp");
    const TestApplication application({m_folder.plugins()}, true);
    const auto ui = std::make_shared<NotingUI>();
    installVUI(ui);
    EXPECT_TRUE(m_host.Scan(true, true));
    installVUI(nullptr);
    EXPECT_EQ(ui->heard.join("; ").remove(vst2Ending()),
              "range 2 ; value 0; 60000 Scanning: a Shell; show; range 2 Scanning WaveShell; "
              "60000 Scanning: A; show; value 1; 60000 Scanning: B; show; value 2; notified fffffff; "
              "notified fffffff; range 2 ; value 0; value 1; 60000 Scanning: b Comp; show; "
              "notified fffffff; value 2");
}

TEST_F(VSTHostTest, OfTwoSpecialShellsTheNewerStays)
{
    const char *const old = "WaveShell1-VST 9.2_x64", *const newer = "WaveShell1-VST 9.3_x64";
    const struct {
        const char *name, *first, *second;
        bool replaces;
    } rows[] = {{"newer after older", old, newer, true},
                {"older after newer", newer, old, false},
                {"same version", newer, "WaveShell2-VST 9.3_x64", false},
                {"compared as numbers", newer, "WaveShell12-VST 10_x64", true},
                {"a comma", old, "WaveShell1-VST 99,3_x64", false},
                {"not a number", old, "WaveShell1-VST nan_x64", false},
                {"more in front", old, "My WaveShell1-VST 99.3_x64", false},
                {"more behind", old, "WaveShell1-VST 99.3_x64 copy", false},
                {"without a version after one with", old, "WaveShell", false},
                {"with a version after one without", "WaveShell", old, true},
                {"the rule is for the later one's path", "Other", newer, true},
                {"another file after a shell", old, "Other", false}};
    for (const auto &row : rows) {
        VSTHost host;
        EffectRecord record;
        record.id = record.name = "Q10";
        const auto add = [&](const char *file) {
            record.path = QStringLiteral("/fx/") + file + PluginLibrary::fileEnding();
            return host.AddEffect(record);
        };
        EXPECT_TRUE(add(row.first)) << row.name;
        const QString first = record.path;
        EXPECT_EQ(add(row.second), row.replaces) << row.name;
        ASSERT_EQ(host.effects().size(), 1u) << row.name;
        EXPECT_EQ(host.effects()[0].path, row.replaces ? record.path : first) << row.name;
    }
}
