#pragma once

#include <memory>

/// The keys that a user presses while a scan runs. As long as it lives, a terminal hands them over one by one
/// and does not show them; where the input is none, or another program has it at the moment, there are none.
/// Ctrl-C, Ctrl-\\ and Ctrl-Z stay what they are. One object at a time.
class TerminalKeys {
public:
    TerminalKeys();
    /// Puts the terminal back.
    ~TerminalKeys();
    TerminalKeys(const TerminalKeys &) = delete;
    TerminalKeys &operator=(const TerminalKeys &) = delete;

    /// True when keys can come.
    bool areThere() const;
    /// A key pressed since the last call, in lower case; 0: none. Never waits.
    char take();

private:
    struct Mode;
    std::unique_ptr<Mode> m_mode; ///< the terminal; null: the input is none
};
