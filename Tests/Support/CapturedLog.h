#pragma once

#include "Core/BaseLib/Log/LogSink.h"

#include <QStringList>

#include <memory>

/// Collects what the debug log writes while it lives, without time stamps.
class CapturedLog {
public:
    CapturedLog();
    ~CapturedLog();
    CapturedLog(const CapturedLog &) = delete;
    CapturedLog &operator=(const CapturedLog &) = delete;

    QStringList lines() const;
    /// How many lines hold the text.
    int count(const QString &text) const;
    bool contains(const QString &text) const { return count(text) > 0; }

private:
    class Sink;
    std::shared_ptr<Sink> m_sink;
};
