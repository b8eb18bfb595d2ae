#include "Core/BaseLib/Log/LogSink.h"

std::shared_ptr<FileLogSink> FileLogSink::onStandardError()
{
    auto sink = std::make_shared<FileLogSink>();
    sink->m_file.open(stderr, QIODevice::WriteOnly); // in the text mode of the C stream
    return sink;
}

std::shared_ptr<FileLogSink> FileLogSink::appendingTo(const QString &path)
{
    auto sink = std::make_shared<FileLogSink>();
    sink->m_file.setFileName(path);
    const bool isOpen = sink->m_file.open(QIODevice::WriteOnly | QIODevice::Append | QIODevice::Text);
    return isOpen ? sink : nullptr;
}

void FileLogSink::write(int, const QString &line)
{
    const QByteArray bytes = line.toUtf8() + '\n';
    const std::lock_guard<std::mutex> lock(m_mutex);
    // NOTE: On Windows Qt goes to the end only once, and the workstation may write to the same file.
    if (!m_file.isSequential() && (m_file.openMode() & QIODevice::Append) != 0)
        m_file.seek(m_file.size());
    m_file.write(bytes);
    m_file.flush();
}
