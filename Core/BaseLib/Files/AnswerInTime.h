#pragma once

#include <chrono>
#include <future>
#include <memory>
#include <optional>
#include <thread>

/// Asks the file system something on a thread of its own. Nothing when the answer does not come in time, as
/// from a network drive whose server is gone: the thread is left behind then. What `ask` captures must be
/// copies.
template <typename Ask>
auto answerInTime(std::chrono::milliseconds limit, Ask ask) -> std::optional<decltype(ask())>
{
    using Answer = decltype(ask());
    // Twice, each for half of the time: under Wine a new thread now and then does not come to its answer.
    for (int attempt = 0; attempt < 2; ++attempt) {
        const auto promise = std::make_shared<std::promise<Answer>>();
        std::future<Answer> answer = promise->get_future();
        std::thread([promise, ask] { promise->set_value(ask()); }).detach();
        if (answer.wait_for(limit / 2) == std::future_status::ready)
            return answer.get();
    }
    return std::nullopt;
}
