#include "Tests/Scanner/posix/VirtualScreen.h"

#include <QDeadlineTimer>

#include <cstdlib>
#include <cstring>
#include <memory>

namespace {

/// The X library's answers are freed with free().
struct Freed {
    void operator()(void *answer) const { std::free(answer); }
};
template <typename Answer>
std::unique_ptr<Answer, Freed> owned(Answer *answer)
{
    return std::unique_ptr<Answer, Freed>(answer);
}

} // namespace

VirtualScreen::VirtualScreen()
{
    if (!startServer())
        return;
    m_connection = xcb_connect(m_name.toLatin1().constData(), nullptr);
    if (xcb_connection_has_error(m_connection)) {
        m_reason = "cannot connect to Xvfb at " + m_name;
        return;
    }
    m_root = xcb_setup_roots_iterator(xcb_get_setup(m_connection)).data->root;
    const quint32 events = XCB_EVENT_MASK_SUBSTRUCTURE_NOTIFY;
    xcb_change_window_attributes(m_connection, m_root, XCB_CW_EVENT_MASK, &events);
    xcb_flush(m_connection);
}

VirtualScreen::~VirtualScreen()
{
    if (m_connection)
        xcb_disconnect(m_connection);
    kill();
}

bool VirtualScreen::startServer()
{
    m_server.start("Xvfb", {"-displayfd", "1", "-nolisten", "tcp", "-screen", "0", "800x600x24"});
    QByteArray number;
    while (!number.endsWith('\n') && m_server.waitForReadyRead(20000))
        number += m_server.readAllStandardOutput();
    m_name = ':' + QString::fromLatin1(number.trimmed());
    if (number.endsWith('\n'))
        return true;
    m_reason = QStringLiteral("Xvfb did not start: %1\n%2")
                   .arg(m_server.errorString(), QString::fromUtf8(m_server.readAllStandardError()));
    return false;
}

void VirtualScreen::kill()
{
    m_windowManager.kill();
    m_windowManager.waitForFinished(-1);
    m_server.kill();
    m_server.waitForFinished(-1);
}

xcb_atom_t VirtualScreen::atom(const char *name) const
{
    const auto request = xcb_intern_atom(m_connection, 0, static_cast<quint16>(std::strlen(name)), name);
    const auto answer = owned(xcb_intern_atom_reply(m_connection, request, nullptr));
    return answer ? answer->atom : static_cast<xcb_atom_t>(XCB_ATOM_NONE);
}

int VirtualScreen::takeAppeared()
{
    int count = 0;
    while (const auto event = owned(xcb_poll_for_event(m_connection)))
        count += (event->response_type & 0x7F) == XCB_MAP_NOTIFY ? 1 : 0;
    return count;
}

QByteArray VirtualScreen::property(xcb_window_t window, const char *name) const
{
    const auto request =
        xcb_get_property(m_connection, 0, window, atom(name), XCB_GET_PROPERTY_TYPE_ANY, 0, 256);
    const auto answer = owned(xcb_get_property_reply(m_connection, request, nullptr));
    if (!answer)
        return QByteArray();
    return {static_cast<const char *>(xcb_get_property_value(answer.get())),
            xcb_get_property_value_length(answer.get())};
}

bool VirtualScreen::isFocusedOnTop(xcb_window_t window) const
{
    // Only the window manager adds the focus: what the program wrote before is not enough.
    const QByteArray states = property(window, "_NET_WM_STATE");
    const auto has = [&](const char *name) {
        const xcb_atom_t state = atom(name);
        return states.contains(QByteArray(reinterpret_cast<const char *>(&state), sizeof state));
    };
    return has("_NET_WM_STATE_FOCUSED") && has("_NET_WM_STATE_ABOVE");
}

void VirtualScreen::setResolution(int dotsPerInch) const
{
    const QByteArray resources = "Xft.dpi:\t" + QByteArray::number(dotsPerInch) + '\n';
    xcb_change_property(m_connection, XCB_PROP_MODE_REPLACE, m_root, atom("RESOURCE_MANAGER"),
                        XCB_ATOM_STRING, 8, static_cast<quint32>(resources.size()), resources.constData());
    xcb_flush(m_connection);
}

bool VirtualScreen::startWindowManager()
{
    // Its settings are its own, not those of the user.
    m_windowManager.setProgram("env");
    m_windowManager.setArguments({"HOME=/nonexistent", "icewm", "--display=" + m_name});
    m_windowManager.start();
    const QDeadlineTimer deadline(20000);
    while (property(m_root, "_NET_SUPPORTING_WM_CHECK").isEmpty())
        if (m_windowManager.waitForFinished(10) || deadline.hasExpired())
            return false;
    return true;
}

QSize VirtualScreen::sizeOf(xcb_window_t window) const
{
    const auto answer =
        owned(xcb_get_geometry_reply(m_connection, xcb_get_geometry(m_connection, window), nullptr));
    return answer ? QSize(answer->width, answer->height) : QSize();
}

bool VirtualScreen::isVisible(xcb_window_t window) const
{
    const auto request = xcb_get_window_attributes(m_connection, window);
    const auto answer = owned(xcb_get_window_attributes_reply(m_connection, request, nullptr));
    return answer && answer->map_state == XCB_MAP_STATE_VIEWABLE;
}

xcb_window_t VirtualScreen::windowTitled(const QString &title) const { return windowTitled(title, m_root); }

xcb_window_t VirtualScreen::windowTitled(const QString &title, xcb_window_t parent) const
{
    const auto tree =
        owned(xcb_query_tree_reply(m_connection, xcb_query_tree(m_connection, parent), nullptr));
    for (int i = 0; tree && i < xcb_query_tree_children_length(tree.get()); ++i) {
        const xcb_window_t window = xcb_query_tree_children(tree.get())[i];
        if (isVisible(window) && property(window, "_NET_WM_NAME") == title.toUtf8())
            return window;
        if (const xcb_window_t framed = windowTitled(title, window))
            return framed;
    }
    return 0;
}

void VirtualScreen::requestClose(const QString &title) const
{
    xcb_client_message_event_t message = {};
    message.response_type = XCB_CLIENT_MESSAGE;
    message.format = 32;
    message.window = windowTitled(title);
    message.type = atom("WM_PROTOCOLS");
    message.data.data32[0] = atom("WM_DELETE_WINDOW");
    xcb_send_event(m_connection, 0, message.window, XCB_EVENT_MASK_NO_EVENT,
                   reinterpret_cast<const char *>(&message));
    xcb_flush(m_connection);
}
