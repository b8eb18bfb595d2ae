#include "Main/VLib/SimpleGUI.h"

#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/NotingUI.h"

#include <gtest/gtest.h>

namespace {

class SimpleGUI : public ::testing::Test {
protected:
    ~SimpleGUI() override { installVUI(nullptr); }

    std::shared_ptr<NotingUI> installUI() const
    {
        auto ui = std::make_shared<NotingUI>();
        installVUI(ui);
        return ui;
    }

    const CapturedLog log;
};

QString repeated(const char *utf8, int count) { return QString::fromUtf8(utf8).repeated(count); }

} // namespace

TEST_F(SimpleGUI, WithoutInterfaceQuestionsAreAnsweredYesAndMessagesVanish)
{
    EXPECT_TRUE(askUser(L"Load %ls?", "Fuzz"));
    showStatus(L"one");
    showScanning("two");
    notifyUI(MessageCode::kEntryAdded);
    EXPECT_EQ(createProgressDisplay(), nullptr);
    EXPECT_EQ(userMessageBox("Hello", 4), 0);
    EXPECT_EQ(log.lines(), QStringList({"Asking user \"Load Fuzz?\"", "User answered yes", "UserMessageBox",
                                        ": No globalUi - using AfxMessageBox",
                                        "Assertion failed: \"0\", Main/VLib/SimpleGUI, line 216"}));
}

TEST_F(SimpleGUI, FoldersOfTheWorkstationAloneAreAssertions)
{
    QString lines;
    for (std::size_t index = 0; index < std::size(kWorkstationOnlyFolders); ++index) {
        EXPECT_STREQ(workstationOnlyFolder(index), L"");
        EXPECT_TRUE(log.lines().last().startsWith("Assertion failed: \"0\", Main/VLib/SimpleGUI"));
        lines += log.lines().last().section(' ', -1) + ' ';
    }
    EXPECT_EQ(lines, "483 771 949 1011 1092 1184 1239 ");
}

TEST_F(SimpleGUI, EachMessageReachesTheInterface)
{
    const auto ui = installUI();
    const wchar_t *none = nullptr;
    EXPECT_FALSE(askUser(L"Load?")) << "it cannot ask";
    EXPECT_EQ(userMessageBox("50% done", 4), 5) << "its own answer";
    showStatus(L"%d of %d", 1, 2);
    showStatus(none);
    showScanning("Fuzz");
    notifyUI(MessageCode::kEntryAdded);
    userWarning(L"No %ls", "entry");
    userWarning(none);
    EXPECT_EQ(ui->heard, QStringList({"box 50% done", "1 of 2", "", "60000 Scanning: Fuzz", "show",
                                      "notified fffffff", "warned No entry", "warned "}));
    EXPECT_EQ(log.lines(), QStringList({"Asking user \"Load?\"", "User answered no",
                                        "User Warning - No entry", "User Warning - "}));
}

TEST_F(SimpleGUI, TextsArriveWholeUpToTheLimit)
{
    const QString japanese = "日本語プラグイン";
    const struct {
        const char *name;
        QString text;
        QString shown;
    } rows[] = {
        {"at the limit", repeated("x", 550), repeated("x", 550)},
        {"one too long", repeated("x", 551), repeated("x", 550)},
        {"far too long", repeated("x", 70000), repeated("x", 550)},
        {"Japanese, too long", repeated("語", 600), repeated("語", 550)},
        {"emoji across the limit", "x" + repeated("🎛", 300), "x" + repeated("🎛", 274)},
        {"emoji up to the limit", repeated("🎛", 300), repeated("🎛", 275)},
        {"Japanese", japanese, japanese},
        {"percent signs are no format", "100%s %n %ls", "100%s %n %ls"},
    };
    for (const auto &row : rows) {
        const auto ui = installUI();
        showStatus(L"%ls", row.text);
        EXPECT_EQ(ui->heard, QStringList(row.shown)) << row.name;
    }
}

TEST_F(SimpleGUI, OnlyTheInstalledInterfaceIsRemoved)
{
    const auto first = installUI();
    const auto second = installUI();
    uninstallVUI(first);
    EXPECT_EQ(installedVUI(), second);
    uninstallVUI(second);
    EXPECT_EQ(installedVUI(), nullptr);
    EXPECT_EQ(second.use_count(), 1);
}
