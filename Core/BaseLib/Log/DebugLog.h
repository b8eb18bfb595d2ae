#pragma once

#include "Core/BaseLib/Log/FormatText.h"

#include <memory>

class LogSink;

/// Process-wide switches of the debug log. Set them before threads start; they are read without a lock.
struct DebugLogSettings {
    bool off = false;          ///< nothing is logged
    bool timeStamp = true;     ///< each line starts with the time since the process started
    bool directOutput = false; ///< lines go to the direct sink instead, unchanged
    bool debuggerOutput =
        true;           ///< lines also go to an attached debugger, where the system has such a channel
    bool trace = false; ///< lines of `DebugTrace` are logged at all
    int level = 0;      ///< handed to the sink with each line
};

/// Longest message after the time stamp, in UTF-16 units; a longer one is cut.
inline constexpr int kMaxLogMessage = 1000;

DebugLogSettings &debugLogSettings();

/// Installs the sink that stores the lines (null: none). Call before threads start.
void setLogSink(std::shared_ptr<LogSink> sink);
/// Installs the sink for `DebugLogSettings::directOutput` (null: none). Call before threads start.
void setDirectLogSink(std::shared_ptr<LogSink> sink);

/// Sets the log up as the environment asks: "FXPROBE_LOG" names a file to append to (standard error without
/// it), "FXPROBE_TRACE=1" adds the trace lines.
void configureLogFromEnvironment();

/// Logs one finished message. Any thread; never throws.
void debugLogMessage(const QString &message) noexcept;
/// Reports on Qt's debug channel that logging a line threw.
void reportLogException() noexcept;

/// Logs one line, printf-style. Any thread; never throws.
template <typename... Arguments>
void DebugLog(const wchar_t *format, const Arguments &...arguments) noexcept
{
    if (debugLogSettings().off)
        return;
    try {
        debugLogMessage(formatText(format, arguments...));
    } catch (...) {
        reportLogException();
    }
}

/// The same for the lines that describe each single call; formats nothing while the trace switch is off.
template <typename... Arguments>
void DebugTrace(const wchar_t *format, const Arguments &...arguments) noexcept
{
    if (debugLogSettings().trace)
        DebugLog(format, arguments...);
}
