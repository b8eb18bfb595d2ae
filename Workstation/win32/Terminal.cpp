#include "Workstation/Terminal.h"

#include <cstdio>

#include <io.h>

#include <qt_windows.h>

namespace {

/// Where results go.
std::FILE *s_result = stdout;

HANDLE handleOf(std::FILE *stream) { return reinterpret_cast<HANDLE>(_get_osfhandle(_fileno(stream))); }

bool isConsole(std::FILE *stream)
{
    DWORD mode = 0;
    return GetConsoleMode(handleOf(stream), &mode) != 0;
}

/// A console takes UTF-16 as it is, whatever its code page; a pipe or a file gets UTF-8.
bool write(std::FILE *stream, const QString &text)
{
    if (isConsole(stream)) {
        DWORD written = 0;
        return WriteConsoleW(handleOf(stream), text.utf16(), static_cast<DWORD>(text.size()), &written,
                             nullptr) != 0;
    }
    const QByteArray bytes = text.toUtf8();
    const auto size = static_cast<std::size_t>(bytes.size());
    return std::fwrite(bytes.constData(), 1, size, stream) == size && std::fflush(stream) == 0;
}

} // namespace

bool Terminal::print(const QString &text) { return write(s_result, text); }

bool Terminal::printError(const QString &text) { return write(stderr, text); }

bool Terminal::outputIsTerminal() { return isConsole(s_result); }

void Terminal::keepOutputForResult()
{
    const int copy = _dup(_fileno(stdout));
    std::FILE *result = copy < 0 ? nullptr : _fdopen(copy, "w");
    if (!result)
        return;
    s_result = result;
    _dup2(_fileno(stderr), _fileno(stdout));
    SetStdHandle(STD_OUTPUT_HANDLE, GetStdHandle(STD_ERROR_HANDLE));
}

bool Terminal::errorIsTerminal()
{
    HANDLE handle = GetStdHandle(STD_ERROR_HANDLE);
    DWORD mode = 0;
    return GetConsoleMode(handle, &mode) && SetConsoleMode(handle, mode | ENABLE_VIRTUAL_TERMINAL_PROCESSING);
}

int Terminal::errorWidth()
{
    constexpr int kUsualWidth = 80;
    CONSOLE_SCREEN_BUFFER_INFO info = {};
    if (!GetConsoleScreenBufferInfo(GetStdHandle(STD_ERROR_HANDLE), &info))
        return kUsualWidth;
    return info.srWindow.Right - info.srWindow.Left + 1;
}
