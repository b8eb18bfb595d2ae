#pragma once

#include "Main/VLib/VProgressDisplay.h"

#include <memory>

class StatusHandover;

/// Progress of a plug-in scan, shown by the scanner's window at its next tick. One thread at a time.
class VSTProgress : public VProgressDisplay {
public:
    /// `status` is what the window polls.
    explicit VSTProgress(std::shared_ptr<StatusHandover> status);

    void begin(const QString &text, int value) override;
    void finish() override;
    void setValue(int value) override;
    void step(int delta) override;
    void setRange(int total, const QString &text) override;
    void setText(const QString &text) override;
    bool isCancelled() const override;

private:
    std::shared_ptr<StatusHandover> m_status;
    int m_current = 0;
    int m_total = 0;
};
