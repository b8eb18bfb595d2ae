#include "Core/BaseLib/PluginLibrary.h"

#include <QFile>

#include <map>
#include <mutex>

namespace {

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

void PluginLibrary::leaveMapped() { m_handle = nullptr; }

bool PluginLibrary::exists(const QString &path) { return QFile::exists(path); }
