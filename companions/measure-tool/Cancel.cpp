// SPDX-License-Identifier: Apache-2.0
#include "companions/measure-tool/Cancel.h"

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <system_error>
#include <thread>

#include <poll.h>
#include <signal.h>
#include <sys/eventfd.h>
#include <sys/signalfd.h>
#include <time.h>
#include <unistd.h>

#include "base/Descriptor.h"
#include "companions/measure-tool/Failure.h"

namespace measuretool {
namespace {

constexpr int cancelling[] = {SIGINT, SIGHUP, SIGTERM};

/// Limit of a single wait; longer waits are split.
constexpr std::chrono::milliseconds longestWait = std::chrono::hours(1);

std::size_t worksLeft = 0;

sigset_t cancellingSet() {
    sigset_t set;
    sigemptyset(&set);
    for (const int number : cancelling) {
        sigaddset(&set, number);
    }
    return set;
}

/// Waits for one of the signals. They are blocked, so none is missed between two waits.
void waitAtMost(std::chrono::nanoseconds time) {
    const auto whole = std::chrono::duration_cast<std::chrono::seconds>(time);
    const timespec limit{static_cast<time_t>(whole.count()),
                         static_cast<long>((time - whole).count())};
    const sigset_t set = cancellingSet();
    if (sigtimedwait(&set, nullptr, &limit) > 0) {
        throw Failure(Status::Cancelled, "cancelled");
    }
}

base::Descriptor checked(int number) {
    if (number < 0) {
        throw std::system_error(errno, std::generic_category());
    }
    return base::Descriptor(number);
}

/// Waits for the event. False if `end` comes first.
bool awaitEvent(const base::Descriptor& event, Clock::time_point end) {
    const sigset_t set = cancellingSet();
    const base::Descriptor signals = checked(signalfd(-1, &set, SFD_CLOEXEC | SFD_NONBLOCK));
    while (true) {
        const auto left = end - Clock::now();
        if (left <= Clock::duration::zero()) {
            return false;
        }
        pollfd wait[] = {{event.get(), POLLIN, 0}, {signals.get(), POLLIN, 0}};
        const auto limit = std::chrono::ceil<std::chrono::milliseconds>(
            std::min<Clock::duration>(left, longestWait));
        if (poll(wait, 2, static_cast<int>(limit.count())) < 0 && errno != EINTR) {
            throw std::system_error(errno, std::generic_category());
        }
        if ((wait[0].revents & POLLIN) != 0) {
            return true;
        }
        checkCancelled();
    }
}

} // namespace

void listenForCancel() {
    const sigset_t set = cancellingSet();
    sigprocmask(SIG_BLOCK, &set, nullptr);
}

void checkCancelled() {
    waitAtMost(std::chrono::nanoseconds(0));
}

void pauseFor(std::chrono::milliseconds time) {
    const auto end = Clock::now() + time;
    // Another signal, such as the one for a resized window, can end a wait early.
    for (auto left = end - Clock::now(); left.count() > 0; left = end - Clock::now()) {
        waitAtMost(left);
    }
    checkCancelled();
}

// Only a handler could make a signal interrupt a read, and even that fails while the file system
// waits for a server. So the read runs in a thread, which is abandoned on a cancel.
bool awaitWork(std::function<void()> work, Clock::time_point end) {
    checkCancelled();
    const auto done = std::make_shared<base::Descriptor>(checked(eventfd(0, EFD_CLOEXEC)));
    std::thread([work = std::move(work), done] {
        work();
        eventfd_write(done->get(), 1);
    }).detach();
    ++worksLeft; // Counts even if the wait ends with an exception.
    if (!awaitEvent(*done, end)) {
        return false;
    }
    --worksLeft;
    return true;
}

bool hasLeftWork() {
    return worksLeft > 0;
}

} // namespace measuretool
