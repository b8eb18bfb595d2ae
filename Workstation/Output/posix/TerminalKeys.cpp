#include "Workstation/Output/TerminalKeys.h"

#include <cctype>
#include <cerrno>
#include <csignal>

#include <poll.h>
#include <termios.h>
#include <unistd.h>

namespace {

// Of the process: a signal handler must find them.
termios s_before = {};                    ///< what the terminal was like when its keys were taken
volatile std::sig_atomic_t s_isTaken = 0; ///< it has to be put back

/// A program in the background that touches its terminal is stopped.
bool isOurs() { return tcgetpgrp(STDIN_FILENO) == getpgrp(); }

/// Does only what a signal handler may do.
void putBack()
{
    if (s_isTaken != 0 && isOurs())
        tcsetattr(STDIN_FILENO, TCSANOW, &s_before);
    s_isTaken = 0;
}

/// What ends or stops us without a word: not every shell puts its terminal back after that. The handler is
/// gone when it is called, so that the signal then does what it always does.
void onSignal(int number)
{
    const int error = errno;
    putBack();
    raise(number);
    errno = error;
}

void listen(int number)
{
    struct sigaction action = {};
    if (sigaction(number, nullptr, &action) != 0 || action.sa_handler != SIG_DFL)
        return;
    action = {};
    action.sa_handler = onSignal;
    action.sa_flags = static_cast<int>(SA_RESTART | SA_NODEFER | SA_RESETHAND);
    sigemptyset(&action.sa_mask);
    sigaction(number, &action, nullptr);
}

} // namespace

struct TerminalKeys::Mode {};

TerminalKeys::TerminalKeys()
{
    termios mode = {};
    if (tcgetattr(STDIN_FILENO, &mode) == 0)
        m_mode = std::make_unique<Mode>();
}

TerminalKeys::~TerminalKeys() { putBack(); }

bool TerminalKeys::areThere() const { return m_mode && isOurs(); }

char TerminalKeys::take()
{
    if (!areThere())
        return 0;
    // Each time: a shell that had stopped us, or takes us out of the background, has its own mode. What was
    // found while it had the terminal would be wrong for the next program.
    termios mode = {};
    if (tcgetattr(STDIN_FILENO, &mode) == 0 && (mode.c_lflag & (ICANON | ECHO)) != 0) {
        s_before = mode;
        s_isTaken = 1;
        listen(SIGQUIT);
        listen(SIGTSTP);
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
