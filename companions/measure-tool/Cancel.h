// SPDX-License-Identifier: Apache-2.0
// Lets a person end a measurement: with Ctrl-C, by closing the terminal, or through an application
// (SIGINT, SIGHUP, SIGTERM).
#pragma once

#include <chrono>
#include <functional>
#include <future>
#include <memory>
#include <optional>
#include <type_traits>
#include <utility>

namespace measuretool {

using Clock = std::chrono::steady_clock;

/// After this call these signals no longer end the process; the other functions handle them.
/// REQUIRES: no other thread is running yet.
void listenForCancel();

/// Throws Failure (Cancelled) if the run was cancelled.
void checkCancelled();

/// Waits. Throws Failure (Cancelled) as soon as the run is cancelled.
void pauseFor(std::chrono::milliseconds time);

/// Runs `work` in its own thread and waits for it. Returns false if `end` comes first. Throws
/// Failure (Cancelled) as soon as the run is cancelled. In both cases the work continues alone.
bool awaitWork(std::function<void()> work, Clock::time_point end);

/// True if awaitWork has left a thread running that may never end. The process must then exit
/// without the destructors of static objects, which the thread may still use.
bool hasLeftWork();

/// Returns the result of `work`, which may block in the file system: on a pipe, or on a share with
/// a lost server. Empty if `end` comes first. Throws what the work throws, and Failure (Cancelled).
/// REQUIRES: the work owns everything it uses, since it may outlive the caller.
template<class Work>
std::optional<std::invoke_result_t<Work>> resultBefore(Clock::time_point end, Work work) {
    const auto task =
        std::make_shared<std::packaged_task<std::invoke_result_t<Work>()>>(std::move(work));
    auto result = task->get_future();
    if (!awaitWork([task] { (*task)(); }, end)) {
        return std::nullopt;
    }
    return result.get();
}

/// Same without a time limit.
template<class Work>
std::invoke_result_t<Work> unlessCancelled(Work work) {
    return *resultBefore(Clock::time_point::max(), std::move(work));
}

} // namespace measuretool
