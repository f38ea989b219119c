// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Batch.h"

#include <algorithm>
#include <condition_variable>
#include <cstddef>
#include <exception>
#include <map>
#include <mutex>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

#include <sched.h>

namespace check {
namespace {

class Batch {
  public:
    Batch(const std::function<std::optional<Measurement>()>& next,
          const std::function<Outcome(const Measurement&)>& work,
          const std::function<bool(Outcome&&)>& emit, unsigned threads)
        : m_next(next), m_work(work), m_emit(emit), m_window(outcomesOfThread * threads) {}

    void run() {
        try {
            takeAll();
        } catch (...) {
            const std::lock_guard lock(m_mutex);
            m_failure = std::current_exception();
            m_stopped = m_ended = true;
            m_emitted.notify_all();
        }
    }

    void rethrowFailure() const {
        if (m_failure) {
            std::rethrow_exception(m_failure);
        }
    }

  private:
    static constexpr std::size_t outcomesOfThread = 16;

    void takeAll() {
        std::unique_lock lock(m_mutex);
        while (true) {
            m_emitted.wait(lock, [&] { return m_ended || m_taken < m_first + m_window; });
            if (m_ended) {
                return;
            }
            const std::optional<Measurement> measurement = m_next();
            if (!measurement) {
                m_ended = true;
                m_emitted.notify_all();
                return;
            }
            const std::size_t number = m_taken++;
            lock.unlock();
            Outcome outcome = m_work(*measurement);
            lock.lock();
            m_waiting.emplace(number, std::move(outcome));
            emitInOrder();
        }
    }

    void emitInOrder() {
        bool any = false;
        while (!m_waiting.empty() && m_waiting.begin()->first == m_first) {
            Outcome outcome = std::move(m_waiting.begin()->second);
            m_waiting.erase(m_waiting.begin());
            ++m_first;
            any = true;
            if (!m_stopped && !m_emit(std::move(outcome))) {
                m_stopped = m_ended = true;
            }
        }
        if (any) {
            m_emitted.notify_all();
        }
    }

    const std::function<std::optional<Measurement>()>& m_next;
    const std::function<Outcome(const Measurement&)>& m_work;
    const std::function<bool(Outcome&&)>& m_emit;
    const std::size_t m_window;
    std::mutex m_mutex;
    std::condition_variable m_emitted;
    std::map<std::size_t, Outcome> m_waiting; ///< For those in front of them.
    std::size_t m_taken = 0;
    std::size_t m_first = 0; ///< The number of the outcome that is emitted next.
    bool m_ended = false;    ///< No further measurement is taken.
    bool m_stopped = false;  ///< Nothing is emitted any more.
    std::exception_ptr m_failure;
};

} // namespace

void verifyAll(const std::function<std::optional<Measurement>()>& next,
               const std::function<Outcome(const Measurement&)>& work,
               const std::function<bool(Outcome&&)>& emit, unsigned threads) {
    Batch batch(next, work, emit, std::max(threads, 1U));
    std::vector<std::thread> others;
    try {
        for (unsigned i = 1; i < threads; ++i) {
            others.emplace_back([&] { batch.run(); });
        }
    } catch (const std::system_error&) {
        // Fewer threads do the same work.
    }
    batch.run();
    for (std::thread& thread : others) {
        thread.join();
    }
    batch.rethrowFailure();
}

unsigned availableProcessors() {
    cpu_set_t set;
    CPU_ZERO(&set);
    if (sched_getaffinity(0, sizeof set, &set) == 0 && CPU_COUNT(&set) > 0) {
        return static_cast<unsigned>(CPU_COUNT(&set));
    }
    return std::max(std::thread::hardware_concurrency(), 1U);
}

} // namespace check
