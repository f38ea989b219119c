// SPDX-License-Identifier: Apache-2.0
// The person's way to end a measurement: Ctrl-C, a closed terminal, or an application that asks for
// it (SIGINT, SIGHUP, SIGTERM).
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

/// From here on these signals no longer end the process; they are seen by the other functions.
/// REQUIRES: no other thread runs yet.
void listenForCancel();

/// Throws Failure (Cancelled) if the run was cancelled.
void checkCancelled();

/// Waits, and throws Failure (Cancelled) as soon as the run is cancelled.
void pauseFor(std::chrono::milliseconds time);

/// Runs `work` on a thread of its own and waits for its end. False if `end` comes first. Throws
/// Failure (Cancelled) as soon as the run is cancelled. In both cases the work goes on by itself.
bool awaitWork(std::function<void()> work, Clock::time_point end);

/// True if awaitWork has left a thread behind, whose work may never end. Then a process must end
/// without the destructors of static objects, which the thread may still use.
bool hasLeftWork();

/// The result of `work`, which may block in the file system: a pipe, or a share whose server is
/// gone. Empty if `end` comes first. Throws what the work throws, and Failure (Cancelled).
/// REQUIRES: the work owns all that it touches, since it may outlive the caller.
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

/// The same without a limit of time.
template<class Work>
std::invoke_result_t<Work> unlessCancelled(Work work) {
    return *resultBefore(Clock::time_point::max(), std::move(work));
}

} // namespace measuretool
