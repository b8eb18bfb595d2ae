#include "Workstation/Terminal.h"

#include <cstdio>

#include <qt_windows.h>

namespace {

/// A console takes UTF-16 as it is, whatever its code page; a pipe or a file gets UTF-8.
void write(DWORD which, std::FILE *stream, const QString &text)
{
    HANDLE handle = GetStdHandle(which);
    DWORD mode = 0;
    if (GetConsoleMode(handle, &mode)) {
        DWORD written = 0;
        WriteConsoleW(handle, text.utf16(), static_cast<DWORD>(text.size()), &written, nullptr);
        return;
    }
    const QByteArray bytes = text.toUtf8();
    std::fwrite(bytes.constData(), 1, static_cast<std::size_t>(bytes.size()), stream);
    std::fflush(stream);
}

} // namespace

void Terminal::print(const QString &text) { write(STD_OUTPUT_HANDLE, stdout, text); }

void Terminal::printError(const QString &text) { write(STD_ERROR_HANDLE, stderr, text); }

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
