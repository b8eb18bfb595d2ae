#include "Workstation/Terminal.h"

#include <cstdio>

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

namespace {

/// Where results go.
std::FILE *s_result = stdout;

bool write(std::FILE *stream, const QString &text)
{
    const QByteArray bytes = text.toUtf8();
    const auto size = static_cast<std::size_t>(bytes.size());
    return std::fwrite(bytes.constData(), 1, size, stream) == size && std::fflush(stream) == 0;
}

} // namespace

bool Terminal::print(const QString &text) { return write(s_result, text); }

bool Terminal::printError(const QString &text) { return write(stderr, text); }

bool Terminal::outputIsTerminal() { return isatty(fileno(s_result)) != 0; }

void Terminal::keepOutputForResult()
{
    const int copy = fcntl(STDOUT_FILENO, F_DUPFD_CLOEXEC, STDERR_FILENO + 1);
    std::FILE *result = copy < 0 ? nullptr : fdopen(copy, "w");
    if (!result)
        return;
    s_result = result;
    dup2(STDERR_FILENO, STDOUT_FILENO);
}

bool Terminal::errorIsTerminal() { return isatty(STDERR_FILENO) != 0 && qgetenv("TERM") != "dumb"; }

int Terminal::errorWidth()
{
    constexpr int kUsualWidth = 80;
    winsize size = {};
    const bool isKnown = ioctl(STDERR_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0;
    return isKnown ? size.ws_col : kUsualWidth;
}
