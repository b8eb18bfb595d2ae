#include "Core/BaseLib/Log/DebugLog.h"

#include "Core/BaseLib/Log/DebuggerOutput.h"
#include "Core/BaseLib/Log/HarmlessText.h"
#include "Core/BaseLib/Log/LogSink.h"

#include <QDebug>
#include <QElapsedTimer>

namespace {

struct LogState {
    DebugLogSettings settings;
    std::shared_ptr<LogSink> sink;
    std::shared_ptr<LogSink> directSink;
    QElapsedTimer clock;
};

/// Never destroyed: a plug-in's thread may still log while the process ends.
LogState &logState()
{
    static LogState &state = *[] {
        auto *created = new LogState;
        created->clock.start();
        return created;
    }();
    return state;
}

QString timeStampText()
{
    return formatText(L"%10.3f: ", static_cast<double>(logState().clock.elapsed()) / 1000.0);
}

void deliver(const QString &message)
{
    const LogState &state = logState();
    QString line = cutText(message, kMaxLogMessage);
    if (state.settings.timeStamp)
        line.prepend(timeStampText());
    if (state.settings.directOutput) {
        if (state.directSink)
            state.directSink->write(state.settings.level, line);
        return;
    }
    // So that a later sink of the printf family passes the line through unchanged.
    line.replace(QLatin1Char('%'), QLatin1Char('*'));
    line = harmlessText(line); // a plug-in's text must neither begin a line nor steer a terminal
    if (state.sink)
        state.sink->write(state.settings.level, line);
    if (state.settings.debuggerOutput)
        sendLineToDebugger(line);
}

} // namespace

DebugLogSettings &debugLogSettings() { return logState().settings; }

void setLogSink(std::shared_ptr<LogSink> sink) { logState().sink = std::move(sink); }

void setDirectLogSink(std::shared_ptr<LogSink> sink) { logState().directSink = std::move(sink); }

void configureLogFromEnvironment()
{
    const QString path = qEnvironmentVariable("FXPROBE_LOG");
    auto sink = path.isEmpty() ? FileLogSink::onStandardError() : FileLogSink::appendingTo(path);
    setLogSink(sink ? std::move(sink) : FileLogSink::onStandardError());
    debugLogSettings().trace = qEnvironmentVariableIntValue("FXPROBE_TRACE") != 0;
}

void debugLogMessage(const QString &message) noexcept
{
    if (debugLogSettings().off)
        return;
    try {
        deliver(message);
    } catch (...) {
        reportLogException();
    }
}

void reportLogException() noexcept { qDebug(" Caught an exception"); }
