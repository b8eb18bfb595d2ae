#include "Main/VLib/SimpleGUI.h"

#include "Core/BaseLib/Assertion.h"
#include "Core/BaseLib/DebugLog.h"
#include "Main/VLib/VProgressDisplay.h"
#include "Main/VLib/VUI.h"

#include <utility>

namespace {
std::shared_ptr<VUI> s_ui;
}

void installVUI(std::shared_ptr<VUI> ui) { s_ui = std::move(ui); }

std::shared_ptr<VUI> installedVUI() { return s_ui; }

void SimpleGUIDetail::showStatus(const QString &text)
{
    if (s_ui)
        s_ui->showStatus(text);
}

void SimpleGUIDetail::showStatus(int level, const QString &text)
{
    if (s_ui)
        s_ui->showStatus(level, text);
}

void SimpleGUIDetail::userWarning(const QString &text)
{
    DebugLog(L"User Warning - %ls", text);
    if (s_ui)
        s_ui->warn(text);
}

bool SimpleGUIDetail::askUser(const QString &text)
{
    DebugLog(L"Asking user \"%s\"", text);
    const bool yes = s_ui ? s_ui->askUser(text) : true;
    DebugLog(L"User answered %s", yes ? "yes" : "no");
    return yes;
}

int userMessageBox(const QString &text, int flags)
{
    if (s_ui)
        return s_ui->messageBox(text, flags);
    DebugLog(L"UserMessageBox");
    DebugLog(L": No globalUi - using AfxMessageBox");
    reportAssertion("0", SourcePlace{"Main/VLib/SimpleGUI", 216});
    return 0;
}

void requestShow()
{
    if (s_ui)
        s_ui->requestShow();
}

void notifyUI(quint32 value)
{
    if (s_ui)
        s_ui->notify(value);
}

void showScanning(const QString &what)
{
    showStatusWithLevel(MessageCode::kScanning, L"Scanning: %ls", what);
    requestShow();
}

std::shared_ptr<VProgressDisplay> createProgressDisplay()
{
    return s_ui ? s_ui->createProgressDisplay() : nullptr;
}
