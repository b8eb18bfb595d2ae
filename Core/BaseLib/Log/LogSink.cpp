#include "Core/BaseLib/Log/LogSink.h"

#include "Core/BaseLib/Files/NativeFile.h"

std::shared_ptr<FileLogSink> FileLogSink::onStandardError()
{
    return std::make_shared<FileLogSink>(stderr, false);
}

std::shared_ptr<FileLogSink> FileLogSink::appendingTo(const QString &path)
{
    std::FILE *stream = openStream(path, "a");
    return stream ? std::make_shared<FileLogSink>(stream, true) : nullptr;
}

FileLogSink::FileLogSink(std::FILE *stream, bool ownsStream)
    : m_stream(stream)
    , m_ownsStream(ownsStream)
{}

FileLogSink::~FileLogSink()
{
    if (m_ownsStream)
        std::fclose(m_stream);
}

void FileLogSink::write(int, const QString &line)
{
    const QByteArray bytes = line.toUtf8() + '\n'; // the stream's text mode makes it the platform's
    const std::lock_guard<std::mutex> lock(m_mutex);
    std::fwrite(bytes.constData(), 1, static_cast<std::size_t>(bytes.size()), m_stream);
    std::fflush(m_stream);
}
