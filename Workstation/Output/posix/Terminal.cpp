#include "Workstation/Output/Terminal.h"
#include "Workstation/Output/TerminalStream.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

bool TerminalStream::isTerminal(std::FILE *stream) { return isatty(fileno(stream)) != 0; }

std::optional<bool> TerminalStream::writeAsText(std::FILE *, const QString &) { return std::nullopt; }

std::FILE *TerminalStream::takeOutput()
{
    const int copy = fcntl(STDOUT_FILENO, F_DUPFD_CLOEXEC, STDERR_FILENO + 1);
    std::FILE *stream = copy < 0 ? nullptr : fdopen(copy, "w");
    if (stream)
        dup2(STDERR_FILENO, STDOUT_FILENO);
    return stream;
}

bool Terminal::errorIsTerminal() { return isatty(STDERR_FILENO) != 0 && qgetenv("TERM") != "dumb"; }

int TerminalStream::width(std::FILE *stream)
{
    winsize size = {};
    return ioctl(fileno(stream), TIOCGWINSZ, &size) == 0 ? size.ws_col : 0;
}
