#include "Core/BaseLib/Binary/PluginLibrary.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/PluginThread.h"
#include "Core/BaseLib/Process/ThreadCount.h"

#include <QFile>

#include <map>
#include <mutex>

namespace {

/// How long threads that were asked to end get to do so.
constexpr std::chrono::milliseconds kThreadPatience(50);

struct ProcessCache {
    std::mutex mutex;
    std::map<QString, void *> handles; ///< by full path, ordered by code unit
};

ProcessCache &processCache()
{
    static ProcessCache cache;
    return cache;
}

} // namespace

PluginLibrary::~PluginLibrary() { free(); }

bool PluginLibrary::load(const std::wstring &path) { return load(QString::fromStdWString(path)); }

bool PluginLibrary::load(const QString &path)
{
    m_errorText.clear();
    m_path = path;
    m_threadsBefore = runningThreads();
    if (!useProcessCache) {
        m_handle = loadUncached(path);
        return m_handle != nullptr;
    }
    ProcessCache &cache = processCache();
    const std::lock_guard<std::mutex> lock(cache.mutex);
    const auto known = cache.handles.find(path);
    m_handle = known != cache.handles.end() ? known->second : loadUncached(path);
    if (m_handle)
        cache.handles.emplace(path, m_handle);
    return m_handle != nullptr;
}

void PluginLibrary::setErrorText(const QString &path, const LibrarySearch &search,
                                 const QString &loaderReason)
{
    m_errorText = whyNotLoadable(path, search);
    if (m_errorText.isEmpty())
        m_errorText = loaderReason;
}

QString PluginLibrary::notLoaded(const QString &loaderText)
{
    return QStringLiteral("it could not be loaded: ") + loaderText;
}

void PluginLibrary::leaveMapped() { m_handle = nullptr; }

bool PluginLibrary::freeUnlessRunning()
{
    PluginThread::deliverMessages(); // while the code that they lead to is there
    const bool runsOn = m_handle && !useProcessCache && !newThreadsEnd(m_threadsBefore, kThreadPatience);
    if (runsOn) {
        DebugLog(L"%ls left threads running and stays in memory", m_path);
        leaveMapped();
    }
    free();
    return !runsOn;
}

bool PluginLibrary::exists(const QString &path) { return QFile::exists(path); }
