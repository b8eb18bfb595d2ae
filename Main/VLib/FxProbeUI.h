#pragma once

#include "Main/VLib/VUI.h"

#include <memory>

class StatusHandover;

/// Passes the program's messages to the scanner's window: status texts, progress and requests to be shown.
/// Warnings and questions are not shown there; a question is answered no.
class FxProbeUI : public VUI {
public:
    /// `status` is what the window polls; operations after the window is gone change nothing.
    explicit FxProbeUI(std::shared_ptr<StatusHandover> status);

    void showStatus(const QString &text) override;
    void showStatus(int level, const QString &text) override;
    void notify(quint32 value) override;
    std::shared_ptr<VProgressDisplay> createProgressDisplay() override;
    void requestShow() override;

private:
    std::shared_ptr<StatusHandover> m_status;
};
