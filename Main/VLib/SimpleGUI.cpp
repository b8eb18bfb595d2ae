#include "Main/VLib/SimpleGUI.h"

#include "Core/BaseLib/Log/Assertion.h"
#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/VLib/VProgressDisplay.h"
#include "Main/VLib/VUI.h"

#include <utility>

namespace {

/// Only reached through the atomic operations: threads that plug-ins left behind may still send messages
/// while the interface goes. Never destroyed, for the same reason.
std::shared_ptr<VUI> &uiSlot()
{
    static auto &slot = *new std::shared_ptr<VUI>;
    return slot;
}

} // namespace

void installVUI(std::shared_ptr<VUI> ui) { std::atomic_store(&uiSlot(), std::move(ui)); }

void uninstallVUI(const std::shared_ptr<VUI> &ui)
{
    std::shared_ptr<VUI> expected = ui;
    std::atomic_compare_exchange_strong(&uiSlot(), &expected, std::shared_ptr<VUI>());
}

std::shared_ptr<VUI> installedVUI() { return std::atomic_load(&uiSlot()); }

void SimpleGUIDetail::showStatus(const QString &text)
{
    if (const auto ui = installedVUI())
        ui->showStatus(text);
}

void SimpleGUIDetail::showStatus(int level, const QString &text)
{
    if (const auto ui = installedVUI())
        ui->showStatus(level, text);
}

void SimpleGUIDetail::userWarning(const QString &text)
{
    DebugLog(L"User Warning - %ls", text);
    if (const auto ui = installedVUI())
        ui->warn(text);
}

bool SimpleGUIDetail::askUser(const QString &text)
{
    DebugLog(L"Asking user \"%s\"", text);
    const auto ui = installedVUI();
    const bool yes = ui ? ui->askUser(text) : true;
    DebugLog(L"User answered %s", yes ? "yes" : "no");
    return yes;
}

int userMessageBox(const QString &text, int flags)
{
    if (const auto ui = installedVUI())
        return ui->messageBox(cutText(text, kMaxUserMessage), flags);
    DebugLog(L"UserMessageBox");
    DebugLog(L": No globalUi - using AfxMessageBox");
    reportAssertion("0", SourcePlace{"Main/VLib/SimpleGUI", 216});
    return 0;
}

const wchar_t *workstationOnlyFolder(std::size_t index)
{
    reportAssertion("0", SourcePlace{"Main/VLib/SimpleGUI", kWorkstationOnlyFolders[index]});
    return L"";
}

void requestShow()
{
    if (const auto ui = installedVUI())
        ui->requestShow();
}

void notifyUI(quint32 value)
{
    if (const auto ui = installedVUI())
        ui->notify(value);
}

void showScanning(const QString &what)
{
    showStatusWithLevel(MessageCode::kScanning, L"Scanning: %ls", what);
    requestShow();
}

std::shared_ptr<VProgressDisplay> createProgressDisplay()
{
    const auto ui = installedVUI();
    return ui ? ui->createProgressDisplay() : nullptr;
}
