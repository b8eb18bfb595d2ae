#pragma once

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Log/LogSink.h"

#include <QStringList>

#include <memory>
#include <mutex>

/// Collects what the debug log writes while it lives, without time stamps.
class CapturedLog {
public:
    CapturedLog()
    {
        debugLogSettings() = DebugLogSettings();
        debugLogSettings().timeStamp = false;
        setLogSink(m_sink);
    }
    ~CapturedLog()
    {
        debugLogSettings() = DebugLogSettings();
        setLogSink(nullptr);
        setDirectLogSink(nullptr);
    }
    CapturedLog(const CapturedLog &) = delete;
    CapturedLog &operator=(const CapturedLog &) = delete;

    QStringList lines() const
    {
        const std::lock_guard<std::mutex> lock(m_sink->mutex);
        return m_sink->lines;
    }
    /// How many lines hold the text.
    int count(const QString &text) const { return lines().filter(text).size(); }
    bool contains(const QString &text) const { return count(text) > 0; }

    struct Sink : LogSink {
        void write(int, const QString &line) override
        {
            const std::lock_guard<std::mutex> lock(mutex);
            lines.append(line);
        }
        std::mutex mutex;
        QStringList lines;
    };

private:
    const std::shared_ptr<Sink> m_sink = std::make_shared<Sink>();
};
