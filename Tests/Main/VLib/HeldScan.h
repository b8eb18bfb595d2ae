#pragma once

#include "Core/BaseLib/Process/ManualResetEvent.h"
#include "Main/VLib/SimpleGUI.h"
#include "Main/VLib/UiFxProbe.h"
#include "Main/VLib/VProgressDisplay.h"

#include <QCoreApplication>
#include <QLabel>
#include <QProgressBar>

/// A window whose scan does nothing until it is let go, so that a test decides what each tick finds.
class HeldScan {
public:
    HeldScan()
        : dialog(QString(), [this](const QString &) { m_letGo.waitFor(std::chrono::hours(1)); })
    {}
    ~HeldScan() { m_letGo.set(); }

    /// Lets the scan end and waits for it.
    void finish()
    {
        m_letGo.set();
        while (!dialog.isFinished())
            std::this_thread::yield();
    }
    void tick() { QMetaObject::invokeMethod(&dialog, "OnTimer"); }
    QLabel &label() const { return *dialog.findChild<QLabel *>("label"); }
    QProgressBar &bar() const { return *dialog.findChild<QProgressBar *>("progressBar"); }

private:
    ManualResetEvent m_letGo;

public:
    UiFxProbe dialog;
};
