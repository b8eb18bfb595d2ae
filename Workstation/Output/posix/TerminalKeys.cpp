#include "Workstation/Output/TerminalKeys.h"

#include <cctype>

#include <poll.h>
#include <termios.h>
#include <unistd.h>

struct TerminalKeys::Mode {
    termios before;

    /// A program in the background that touches its terminal is stopped.
    static bool isOurs() { return tcgetpgrp(STDIN_FILENO) == getpgrp(); }
};

TerminalKeys::TerminalKeys()
{
    termios mode = {};
    if (tcgetattr(STDIN_FILENO, &mode) == 0)
        m_mode = std::make_unique<Mode>(Mode{mode});
}

TerminalKeys::~TerminalKeys()
{
    if (m_mode && Mode::isOurs())
        tcsetattr(STDIN_FILENO, TCSANOW, &m_mode->before);
}

bool TerminalKeys::areThere() const { return m_mode && Mode::isOurs(); }

char TerminalKeys::take()
{
    if (!areThere())
        return 0;
    // Each time: a shell that had stopped us, or takes us out of the background, has its own mode.
    termios mode = {};
    if (tcgetattr(STDIN_FILENO, &mode) == 0 && (mode.c_lflag & (ICANON | ECHO)) != 0) {
        mode.c_lflag &= ~static_cast<tcflag_t>(ICANON | ECHO);
        mode.c_cc[VMIN] = 1;
        mode.c_cc[VTIME] = 0;
        tcsetattr(STDIN_FILENO, TCSANOW, &mode);
    }
    pollfd input = {STDIN_FILENO, POLLIN, 0};
    unsigned char key = 0;
    if (poll(&input, 1, 0) <= 0 || (input.revents & POLLIN) == 0 || read(STDIN_FILENO, &key, 1) != 1)
        return 0;
    return static_cast<char>(std::tolower(key));
}
