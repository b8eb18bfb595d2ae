#include "Main/VLib/SimpleGUI.h"

#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/NotingUI.h"
#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

TEST(SimpleGUI, WithoutInterfaceQuestionsAreAnsweredYesAndMessagesVanish)
{
    const CapturedLog log;
    EXPECT_TRUE(askUser(L"Load %ls?", "Fuzz"));
    showScanning("nobody");
    userWarning(L"nobody");
    EXPECT_EQ(createProgressDisplay(), nullptr);
    EXPECT_EQ(userMessageBox("Hello", 4), 0);
    EXPECT_STREQ(workstationOnlyFolder(0), L"");
}

TEST(SimpleGUI, EachMessageReachesTheInstalledInterface)
{
    const CapturedLog log;
    const auto first = std::make_shared<NotingUI>(), ui = std::make_shared<NotingUI>();
    installVUI(first);
    installVUI(ui);
    uninstallVUI(first);
    EXPECT_FALSE(askUser(L"Load?")) << "it cannot ask";
    EXPECT_EQ(userMessageBox("50% done", 4), 5) << "its own answer";
    showStatus(L"%d of %d", 1, 2);
    showStatus(nullptr);
    showScanning("Fuzz");
    notifyUI(MessageCode::kEntryAdded);
    userWarning(L"No %ls", "entry");
    showStatus(L"%ls", "x" + QString("🎛").repeated(300));
    uninstallVUI(ui);
    showStatus(L"nobody");
    EXPECT_EQ(ui->heard,
              QStringList({"box 50% done", "1 of 2", "", "60000 Scanning: Fuzz", "show", "notified fffffff",
                           "warned No entry", "x" + QString("🎛").repeated(274)}));
    EXPECT_EQ(first->heard, QStringList());
}
