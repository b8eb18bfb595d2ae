#include "Main/AudioEngineController/Effects/VST/VSTHost.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/VSTHostContext.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"
#include "Main/VLib/SimpleGUI.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/NotingUI.h"
#include "Tests/Support/TestApplication.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST2Fixture.h"

#include <QFileInfo>

#include <gtest/gtest.h>

namespace {

class VSTHostTest : public testing::Test {
protected:
    VSTHostTest() { m_host.setCatalogueFolder(m_folder.effects()); }

    /// Adds a module and its record; the identifier is the name.
    void list(const char *id, const QByteArray &script = {}, qint32 category = 1, bool enabled = true)
    {
        EffectRecord record;
        record.name = record.id = id;
        record.path = addVST2File(m_folder.plugins(), record.id, script);
        record.vstCategory = category;
        record.enabled = enabled;
        EXPECT_TRUE(m_host.AddEffect(record));
    }

    TestFolder m_folder;
    const CapturedLog m_log;
    VSTHost m_host;
};

} // namespace

TEST_F(VSTHostTest, LoadsByKey)
{
    list("Comp");
    list("Off", {}, 1, false);
    list("Line", {}, 9);
    list("Q10");
    list("ves Q10", "name \"Cut at the front\"");
    list("Broken", "answer entry null");
    const QString retrying = "Found an old Waves plug-in, retrying as:";
    const QString path = m_folder.plugins() + "/Broken" + vst2Ending();
    const struct {
        const char *key;
        const char *loaded; // name, or null
        QStringList lines;
    } cases[] = {
        {"Comp", "Comp", {"Found: Comp, trying to load"}},
        {"Off", nullptr, {"Found: Off, trying to load", "Off is switched off and not loaded"}},
        {"Line", nullptr, {"Found: Line, trying to load", "Line processes whole files and is not loaded"}},
        {"Broken",
         nullptr,
         {"Found: Broken, trying to load", "The VST plug-in's entry point returned null",
          "VSTPlugin::Load - Failed to Load DLL: " + path, "Broken, Didn't manage it"}},
        {"Waves Waves Q10", "Q10", {retrying, retrying, "Found: Q10, trying to load"}},
        {"Old Waves Q10", "Cut at the front", {retrying, "Found: ves Q10, trying to load"}},
        {"Waves ", nullptr, {retrying}},
        {"Waves", nullptr, {}}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.key);
        const CapturedLog log;
        const auto plugin = m_host.loadByKey(row.key);
        EXPECT_EQ(log.lines(), row.lines);
        EXPECT_EQ(plugin ? plugin->name() : QString(), QString(row.loaded));
    }
    const auto first = m_host.loadByKey("Comp");
    const auto second = m_host.loadByKey("Q10");
    const CapturedLog log;
    VSTHostContext::instance().logLoadedPlugins();
    EXPECT_EQ(log.lines(), QStringList({"VSTs ", "vst: Comp: ", "vst: Q10: "}));
}

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
    const QString ending = vst2Ending();
    const QString child = "; show; value ";
    EXPECT_EQ(
        ui->heard.join("; "),
        "range 2 ; value 0; 60000 Scanning: a Shell" + ending +
            "; show; range 2 Scanning WaveShell; 60000 Scanning: A" + child + "1; 60000 Scanning: B" + child +
            "2; notified fffffff; notified fffffff; range 2 ; value 0; value 1; 60000 Scanning: b Comp" +
            ending + "; show; notified fffffff; value 2");
}
