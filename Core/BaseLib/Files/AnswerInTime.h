#pragma once

#include <QString>

#include <chrono>
#include <future>
#include <memory>
#include <mutex>
#include <optional>
#include <thread>
#include <utility>
#include <vector>

/// Lets go of a thread that may end at any moment, or never.
inline void leaveBehind(std::thread thread)
{
#ifdef _WIN32
    // NOTE: where a thread is detached just as it ends, winpthreads 10 has later threads of the process never
    // run, or ends the process.
    static std::mutex mutex;
    static auto *const threads = new std::vector<std::thread>; // for ever: one that still runs must not go
    const std::lock_guard<std::mutex> lock(mutex);
    threads->push_back(std::move(thread));
#else
    thread.detach();
#endif
}

/// Asks the file system something on a thread of its own. Nothing when the answer does not come in time, as
/// from a network drive whose server is gone: the thread is left behind then. What `ask` captures must be
/// copies.
template <typename Ask>
auto answerInTime(std::chrono::milliseconds limit, Ask ask) -> std::optional<decltype(ask())>
{
    using Answer = decltype(ask());
    const auto promise = std::make_shared<std::promise<Answer>>();
    std::future<Answer> answer = promise->get_future();
    std::thread thread([promise, ask] { promise->set_value(ask()); });
    if (answer.wait_for(limit) != std::future_status::ready) {
        leaveBehind(std::move(thread));
        return std::nullopt;
    }
    thread.join();
    return answer.get();
}

/// Whether the system tells anything of a file or folder within ten seconds, and within one after another
/// that gave no answer. A path is asked anew after half a minute. Any thread.
bool answers(const QString &path);

/// The same for a file whose folder is likely to hold others that are asked for: only the folder is asked,
/// and where the file is a link what it leads to.
bool fileAnswers(const QString &path);
