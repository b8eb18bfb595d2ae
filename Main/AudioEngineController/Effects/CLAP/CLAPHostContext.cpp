#include "Main/AudioEngineController/Effects/CLAP/CLAPHostContext.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPInterface.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPText.h"

#include <atomic>
#include <deque>
#include <mutex>
#include <thread>

namespace {

/// Messages of one module that are logged; what comes behind could fill a disk.
constexpr int kMostMessages = 100;

struct Host : clap_host {
    explicit Host(const QString &modulePath);

    const QString path;
    const std::thread::id mainThread = std::this_thread::get_id();
    std::atomic<int> messages{0};
};

// Calls of plug-ins, on any thread. Exceptions must not reach them.

Host *hostOf(const clap_host *host) { return host ? static_cast<Host *>(host->host_data) : nullptr; }

void CLAP_ABI log(const clap_host *host, clap_log_severity severity, const char *message)
{
    Host *const own = hostOf(host);
    if (!own || own->messages >= kMostMessages)
        return;
    ++own->messages;
    try {
        const QString text = clapText(message);
        if (severity >= CLAP_LOG_WARNING)
            DebugLog(L"%ls says: %ls", own->path, text);
        else
            DebugTrace(L"%ls says: %ls", own->path, text);
    } catch (...) {
        reportLogException();
    }
}

bool CLAP_ABI isMainThread(const clap_host *host)
{
    const Host *const own = hostOf(host);
    return own && own->mainThread == std::this_thread::get_id();
}

/// There is no audio.
bool CLAP_ABI isAudioThread(const clap_host *) { return false; }

const void *CLAP_ABI extension(const clap_host *, const char *id)
{
    static constexpr clap_host_log_t kLog = {log};
    static constexpr clap_host_thread_check_t kThreadCheck = {isMainThread, isAudioThread};
    if (qstrcmp(id, CLAP_EXT_LOG) == 0)
        return &kLog;
    return qstrcmp(id, CLAP_EXT_THREAD_CHECK) == 0 ? &kThreadCheck : nullptr;
}

/// A plug-in that is only listed is not restarted, run or called back.
void CLAP_ABI ignore(const clap_host *) {}

Host::Host(const QString &modulePath)
    : clap_host{CLAP_VERSION, this, "Quillon", "Tessel", "", "1.0", extension, ignore, ignore, ignore}
    , path(modulePath)
{}

} // namespace

const clap_host &newClapHost(const QString &path)
{
    static std::mutex mutex;
    static auto &all = *new std::deque<Host>; // not even exit handlers may destroy them
    const std::lock_guard<std::mutex> lock(mutex);
    return all.emplace_back(path);
}
