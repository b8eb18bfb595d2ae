#pragma once

#include "Tests/Support/ChildProcess.h"

#include <QSize>
#include <QString>

#include <xcb/xcb.h>

/// An X server without hardware (Xvfb), and a connection that notices every window that appears on it.
class VirtualScreen {
public:
    VirtualScreen();
    ~VirtualScreen();
    VirtualScreen(const VirtualScreen &) = delete;
    VirtualScreen &operator=(const VirtualScreen &) = delete;

    /// Why there is no screen; empty when there is.
    QString reasonAgainst() const { return m_reason; }
    /// The value of DISPLAY for its programs.
    QString name() const { return m_name; }
    /// The display's resolution as programs learn of it, in dots per inch.
    void setResolution(int dotsPerInch) const;
    /// Starts a window manager (IceWM) and waits until it is at work.
    bool startWindowManager();
    /// How many windows appeared since the last call.
    int takeAppeared();
    /// The window with this title that can be seen now; 0 when there is none.
    xcb_window_t windowTitled(const QString &title) const;
    QSize sizeOf(xcb_window_t window) const;
    /// Whether the window manager shows the window as the focused one and as one that stays on top.
    bool isFocusedOnTop(xcb_window_t window) const;
    /// Asks a window to close, as its close button does.
    void requestClose(const QString &title) const;
    /// Ends the server under its programs.
    void kill();

private:
    bool startServer();
    xcb_atom_t atom(const char *name) const;
    /// Of a window, or of the root; empty when it is not set.
    QByteArray property(xcb_window_t window, const char *name) const;
    xcb_window_t windowTitled(const QString &title, xcb_window_t parent) const;
    bool isVisible(xcb_window_t window) const;

    ChildProcess m_server;
    ChildProcess m_windowManager;
    QString m_reason;
    QString m_name;
    xcb_connection_t *m_connection = nullptr;
    xcb_window_t m_root = 0;
};
