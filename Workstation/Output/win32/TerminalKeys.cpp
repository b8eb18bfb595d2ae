#include "Workstation/Output/TerminalKeys.h"

#include <qt_windows.h>

#include <cctype>

struct TerminalKeys::Mode {
    HANDLE console;
};

TerminalKeys::TerminalKeys()
{
    HANDLE console = GetStdHandle(STD_INPUT_HANDLE);
    DWORD mode = 0;
    if (GetConsoleMode(console, &mode))
        m_mode = std::make_unique<Mode>(Mode{console});
}

TerminalKeys::~TerminalKeys() = default;

bool TerminalKeys::areThere() const { return m_mode != nullptr; }

char TerminalKeys::take()
{
    DWORD waiting = 0;
    INPUT_RECORD event = {};
    DWORD count = 0;
    // Events, not characters: nothing has to be set for them, and put back.
    while (m_mode && GetNumberOfConsoleInputEvents(m_mode->console, &waiting) && waiting > 0 &&
           ReadConsoleInputW(m_mode->console, &event, 1, &count) && count == 1) {
        const KEY_EVENT_RECORD &key = event.Event.KeyEvent;
        const wchar_t character = key.uChar.UnicodeChar;
        if (event.EventType == KEY_EVENT && key.bKeyDown && character > 0 && character < 128)
            return static_cast<char>(std::tolower(character));
    }
    return 0;
}
