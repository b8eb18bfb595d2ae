#pragma once

#include "Main/VLib/VProgressDisplay.h"
#include "Main/VLib/VUI.h"

#include <QStringList>

/// Notes what reaches the user interface, one line for each message.
class NotingUI : public VUI {
public:
    void showStatus(const QString &text) override { heard << text; }
    void showStatus(int level, const QString &text) override { heard << QString::number(level) + ' ' + text; }
    void notify(quint32 value) override { heard << "notified " + QString::number(value, 16); }
    void warn(const QString &text) override { heard << "warned " + text; }
    void requestShow() override { heard << "show"; }
    int messageBox(const QString &text, int flags) override
    {
        heard << "box " + text;
        return flags + 1;
    }
    std::shared_ptr<VProgressDisplay> createProgressDisplay() override
    {
        return std::make_shared<Display>(*this);
    }

    QStringList heard;

private:
    class Display : public VProgressDisplay {
    public:
        explicit Display(NotingUI &ui)
            : VProgressDisplay(0)
            , m_ui(ui)
        {}
        void begin(const QString &, int) override {}
        void finish() override {}
        void setValue(int value) override { m_ui.heard << "value " + QString::number(value); }
        void step(int) override {}
        void setRange(int total, const QString &text) override
        {
            m_ui.heard << "range " + QString::number(total) + ' ' + text;
        }
        void setText(const QString &) override {}
        bool isCancelled() const override { return false; }

    private:
        NotingUI &m_ui;
    };
};
