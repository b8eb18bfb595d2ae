#pragma once

#include <QString>

#include <memory>

class VProgressDisplay;

/// The user interface as the rest of the program sees it. Operations may come from any thread.
class VUI {
public:
    virtual ~VUI() = default;

    virtual void showStatus(const QString &text) = 0;
    /// `level` is a message code; see `MessageCode`.
    virtual void showStatus(int level, const QString &text) = 0;
    /// Passes a bare value on, without touching the status text.
    virtual void notify(quint32 value) = 0;
    /// A warning that asks nothing of the user.
    virtual void warn(const QString &) {}
    /// A new progress display; null where there is none.
    virtual std::shared_ptr<VProgressDisplay> createProgressDisplay() = 0;
    /// Asks for the window to be shown.
    virtual void requestShow() = 0;
    /// A yes-or-no question; an interface that cannot ask answers no.
    virtual bool askUser(const QString &) { return false; }
    /// A message box; gives the button pressed, 0 where there is no box.
    virtual int messageBox(const QString & /*text*/, int /*flags*/) { return 0; }
};
