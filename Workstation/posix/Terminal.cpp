#include "Workstation/Terminal.h"

#include <cstdio>

#include <sys/ioctl.h>
#include <unistd.h>

namespace {

void write(std::FILE *stream, const QString &text)
{
    const QByteArray bytes = text.toUtf8();
    std::fwrite(bytes.constData(), 1, static_cast<std::size_t>(bytes.size()), stream);
    std::fflush(stream);
}

} // namespace

void Terminal::print(const QString &text) { write(stdout, text); }

void Terminal::printError(const QString &text) { write(stderr, text); }

bool Terminal::errorIsTerminal() { return isatty(STDERR_FILENO) != 0 && qgetenv("TERM") != "dumb"; }

int Terminal::errorWidth()
{
    constexpr int kUsualWidth = 80;
    winsize size = {};
    const bool isKnown = ioctl(STDERR_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0;
    return isKnown ? size.ws_col : kUsualWidth;
}
