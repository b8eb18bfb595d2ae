#pragma once

#include "Core/BaseLib/Log/FormatText.h"

#include <QString>

#include <cstddef>
#include <memory>

class VProgressDisplay;
class VUI;

/// Messages for the user: formatted here, shown by the process-wide `VUI`, and answered sensibly where none
/// is installed.

/// Codes that go with status texts and notifications.
namespace MessageCode {
inline constexpr int kScanning = 60000; ///< "Scanning: %ls"
inline constexpr int kCompleted =
    1000; ///< the work that a status text announced has ended; the text is empty
inline constexpr quint32 kEntryAdded = 0x0FFFFFFF; ///< an entry came into a catalogue
} // namespace MessageCode

/// Longest message text in UTF-16 units; a longer one is cut.
inline constexpr int kMaxUserMessage = 550;

/// Replaces the process-wide user interface and releases the previous one. Any thread; a message under way
/// still reaches the previous one.
void installVUI(std::shared_ptr<VUI> ui);
/// Removes the user interface if it is still the one installed.
void uninstallVUI(const std::shared_ptr<VUI> &ui);
/// The installed user interface, or null.
std::shared_ptr<VUI> installedVUI();

namespace SimpleGUIDetail {
void showStatus(const QString &text);
void showStatus(int level, const QString &text);
void userWarning(const QString &text);
bool askUser(const QString &text);

template <typename... Arguments>
QString message(const wchar_t *format, const Arguments &...arguments)
{
    return cutText(formatText(format, arguments...), kMaxUserMessage);
}
} // namespace SimpleGUIDetail

/// Shows a status text, printf-style.
template <typename... Arguments>
void showStatus(const wchar_t *format, const Arguments &...arguments)
{
    SimpleGUIDetail::showStatus(SimpleGUIDetail::message(format, arguments...));
}

/// Shows a status text that goes with a message code.
template <typename... Arguments>
void showStatusWithLevel(int level, const wchar_t *format, const Arguments &...arguments)
{
    SimpleGUIDetail::showStatus(level, SimpleGUIDetail::message(format, arguments...));
}

/// Logs a warning and hands it to the user interface.
template <typename... Arguments>
void userWarning(const wchar_t *format, const Arguments &...arguments)
{
    SimpleGUIDetail::userWarning(SimpleGUIDetail::message(format, arguments...));
}

/// Asks a yes-or-no question; logs question and answer. Without a user interface the answer is yes.
template <typename... Arguments>
bool askUser(const wchar_t *format, const Arguments &...arguments)
{
    return SimpleGUIDetail::askUser(SimpleGUIDetail::message(format, arguments...));
}

/// Shows a message box and gives the button pressed; 0 without a user interface.
int userMessageBox(const QString &text, int flags);

/// The further folder getters of the workstation's own interface. This program has none of these folders; the
/// number of each is the source line under which a call is reported.
inline constexpr int kWorkstationOnlyFolders[] = {483, 771, 949, 1011, 1092, 1184, 1239};
/// Reports the call and returns an empty text. `index` is a place in the list above.
const wchar_t *workstationOnlyFolder(std::size_t index);

/// Asks for the window to be shown.
void requestShow();

/// Passes a bare value to the user interface.
void notifyUI(quint32 value);

/// Shows "Scanning: " with what is being scanned, and asks for the window to be shown: a scan started with a
/// path would stay out of sight otherwise.
void showScanning(const QString &what);

/// A progress display of the installed user interface; null where there is none.
std::shared_ptr<VProgressDisplay> createProgressDisplay();
