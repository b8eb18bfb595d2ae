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
    const auto promise = std::make_shared<std::promise<Answer>>();
    std::future<Answer> answer = promise->get_future();
    std::thread([promise, ask = std::move(ask)] { promise->set_value(ask()); }).detach();
    if (answer.wait_for(limit) != std::future_status::ready)
        return std::nullopt;
    return answer.get();
}
