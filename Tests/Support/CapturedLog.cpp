#include "Tests/Support/CapturedLog.h"

#include "Core/BaseLib/Log/DebugLog.h"

class CapturedLog::Sink : public LogSink {
public:
    void write(int, const QString &line) override
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        m_lines.append(line);
    }
    QStringList lines() const
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        return m_lines;
    }

private:
    mutable std::mutex m_mutex;
    QStringList m_lines;
};

CapturedLog::CapturedLog()
    : m_sink(std::make_shared<Sink>())
{
    debugLogSettings() = DebugLogSettings();
    debugLogSettings().timeStamp = false;
    setLogSink(m_sink);
}

CapturedLog::~CapturedLog()
{
    debugLogSettings() = DebugLogSettings();
    setLogSink(nullptr);
    setDirectLogSink(nullptr);
}

QStringList CapturedLog::lines() const { return m_sink->lines(); }

int CapturedLog::count(const QString &text) const { return m_sink->lines().filter(text).size(); }
