#pragma once

#include <QFile>
#include <QString>

#include <memory>
#include <mutex>

/// Where finished log lines are stored. An implementation serialises: any thread may write.
class LogSink {
public:
    virtual ~LogSink() = default;
    /// Stores one line, given without its line end.
    virtual void write(int level, const QString &line) = 0;
};

/// Writes lines as UTF-8, each in one piece and flushed, so that the last line before a crash is there.
class FileLogSink : public LogSink {
public:
    static std::shared_ptr<FileLogSink> onStandardError();
    /// Null when the file cannot be opened.
    static std::shared_ptr<FileLogSink> appendingTo(const QString &path);

    void write(int level, const QString &line) override;

private:
    QFile m_file;
    std::mutex m_mutex;
};
