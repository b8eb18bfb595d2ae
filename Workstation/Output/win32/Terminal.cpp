#include "Workstation/Output/Terminal.h"
#include "Workstation/Output/TerminalStream.h"

#include <fcntl.h>
#include <io.h>

#include <qt_windows.h>

namespace {

HANDLE handleOf(std::FILE *stream) { return reinterpret_cast<HANDLE>(_get_osfhandle(_fileno(stream))); }

} // namespace

bool TerminalStream::isTerminal(std::FILE *stream)
{
    DWORD mode = 0;
    return GetConsoleMode(handleOf(stream), &mode) != 0;
}

// As UTF-16, whatever the console's code page is.
std::optional<bool> TerminalStream::writeAsText(std::FILE *stream, const QString &text)
{
    if (!isTerminal(stream)) {
        _setmode(_fileno(stream), _O_BINARY); // lines end as they are written: CSV's have a CR already
        return std::nullopt;
    }
    DWORD written = 0;
    return WriteConsoleW(handleOf(stream), text.utf16(), static_cast<DWORD>(text.size()), &written,
                         nullptr) != 0;
}

std::FILE *TerminalStream::takeOutput()
{
    const int copy = _dup(_fileno(stdout));
    std::FILE *stream = copy < 0 ? nullptr : _fdopen(copy, "w");
    if (stream) {
        _dup2(_fileno(stderr), _fileno(stdout));
        SetStdHandle(STD_OUTPUT_HANDLE, GetStdHandle(STD_ERROR_HANDLE));
    }
    return stream;
}

bool Terminal::errorIsTerminal()
{
    HANDLE handle = GetStdHandle(STD_ERROR_HANDLE);
    DWORD mode = 0;
    return GetConsoleMode(handle, &mode) && SetConsoleMode(handle, mode | ENABLE_VIRTUAL_TERMINAL_PROCESSING);
}

int TerminalStream::width(std::FILE *stream)
{
    CONSOLE_SCREEN_BUFFER_INFO info = {};
    if (!GetConsoleScreenBufferInfo(handleOf(stream), &info))
        return 0;
    return info.srWindow.Right - info.srWindow.Left + 1;
}
