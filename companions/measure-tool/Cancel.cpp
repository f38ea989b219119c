#include "companions/measure-tool/Cancel.h"

#include <signal.h>
#include <time.h>

#include "companions/measure-tool/Failure.h"

namespace measuring {
namespace {

constexpr int cancelling[] = {SIGINT, SIGHUP, SIGTERM};

sigset_t cancellingSet() {
    sigset_t set;
    sigemptyset(&set);
    for (const int number : cancelling)
        sigaddset(&set, number);
    return set;
}

/// Waits for one of the signals, which are held back and so can't be missed between two waits.
void waitAtMost(std::chrono::nanoseconds time) {
    const auto whole = std::chrono::duration_cast<std::chrono::seconds>(time);
    const timespec limit{static_cast<time_t>(whole.count()),
                         static_cast<long>((time - whole).count())};
    const sigset_t set = cancellingSet();
    if (sigtimedwait(&set, nullptr, &limit) > 0)
        throw Failure(Status::Cancelled, "cancelled");
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
    const auto end = std::chrono::steady_clock::now() + time;
    // Another signal, such as that of a changed window, ends a wait early.
    for (auto left = end - std::chrono::steady_clock::now(); left.count() > 0;
         left = end - std::chrono::steady_clock::now())
        waitAtMost(left);
    checkCancelled();
}

} // namespace measuring
