// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Watch.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <chrono>
#include <filesystem>
#include <map>
#include <mutex>
#include <set>
#include <string_view>
#include <system_error>
#include <unordered_set>
#include <utility>

#include <fcntl.h>
#include <sha2.h>
#include <sys/file.h>
#include <sys/stat.h>

#include "ExitCodes.h"
#include "base/Descriptor.h"
#include "colour/ColourFile.h"
#include "companions/tintgate-check/Arrivals.h"
#include "companions/tintgate-check/Batch.h"
#include "companions/tintgate-check/StopSignal.h"
#include "companions/tintgate-check/Words.h"

namespace check {
namespace {

namespace fs = std::filesystem;
using Clock = std::chrono::steady_clock;

constexpr std::size_t mostBytes = std::size_t{1} << 30;
constexpr std::size_t digits = 64; ///< Of a SHA-256 in hexadecimal.
constexpr int roundsBeforeRetry = 5;
constexpr std::chrono::minutes draftsAreStale{10};

std::string sha256(std::string_view bytes) {
    SHA2_CTX context;
    SHA256Init(&context);
    SHA256Update(&context, reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size());
    std::array<std::uint8_t, SHA256_DIGEST_LENGTH> digest{};
    SHA256Final(digest.data(), &context);
    std::string text;
    for (const std::uint8_t byte : digest) {
        text += "0123456789abcdef"[byte >> 4];
        text += "0123456789abcdef"[byte & 15];
    }
    return text;
}

/// The SHA-256 in the name of a result, or of what is written for a broken measurement; empty for
/// other files.
std::string_view markIn(std::string_view name) {
    for (const std::string_view ending : {".error.json", ".json"}) {
        if (name.ends_with(ending)) {
            name.remove_suffix(ending.size());
            break;
        }
    }
    if (name.size() <= digits || name[name.size() - digits - 1] != '.') {
        return {};
    }
    const std::string_view mark = name.substr(name.size() - digits);
    return mark.find_first_not_of("0123456789abcdef") == mark.npos ? mark : std::string_view();
}

class Watch {
  public:
    Watch(const Aim& aim, const WatchWanted& wanted)
        : m_aim(aim), m_wanted(wanted), m_root(rootOf(wanted.folder)),
          m_results(wanted.out.empty() ? m_root : wanted.out),
          m_outputs(wanted.out, wanted.page, true, wanted.labels, wanted.inputs),
          m_beforeRetry(static_cast<int>(1000 * wanted.interval * roundsBeforeRetry)) {
        lockResults();
        findResults();
    }

    void run(const std::function<void()>& start, const std::function<bool(const Outcome&)>& emit) {
        const StopSignal stop;
        const auto arrivals = m_wanted.poll ? polledArrivals(m_root, m_wanted.interval)
                                            : notifiedArrivals(m_root, m_wanted.interval);
        start();
        bool goesOn = true;
        while (goesOn && !stop.isPending()) {
            std::vector<std::string> paths = arrivals->wait(stop);
            addRetries(paths);
            std::size_t next = 0;
            verifyAll(
                [&]() -> std::optional<Measurement> {
                    if (next == paths.size() || stop.isPending()) {
                        return std::nullopt;
                    }
                    const std::string& path = paths[next++];
                    return Measurement{path, path.substr(m_root.size() + 1), true};
                },
                [&](const Measurement& measurement) { return verifyArrival(measurement); },
                [&](Outcome&& outcome) {
                    goesOn = outcome.isSkipped || emit(outcome);
                    return goesOn;
                },
                static_cast<unsigned>(std::min<std::size_t>(m_wanted.threads, paths.size())));
        }
    }

  private:
    static std::string rootOf(std::string folder) {
        while (folder.size() > 1 && folder.ends_with('/')) {
            folder.pop_back();
        }
        std::error_code ignored;
        if (!fs::is_directory(folder, ignored)) {
            throw Failure(Status::NotDone, {exitInputMissing,
                                            say(Say::WatchFolderGone, {folder}),
                                            {},
                                            say(Say::WatchFolderGoneRemedy)});
        }
        return folder;
    }

    /// Two watches with one folder of results would verify every content twice.
    void lockResults() {
        std::error_code failure;
        fs::create_directories(m_results, failure);
        const std::string path = m_results + "/.tintgate-check.lock";
        m_lock = base::Descriptor(open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0666));
        if (!m_lock.isOpen()) {
            throw Failure(Status::NotDone, {exitResultNotWritten,
                                            say(Say::OutputNotWritten,
                                                {path, std::system_category().message(errno)}),
                                            {},
                                            say(Say::OutputForbiddenRemedy)});
        }
        if (flock(m_lock.get(), LOCK_EX | LOCK_NB) != 0 && errno == EWOULDBLOCK) {
            throw Failure(Status::NotDone,
                          {0, say(Say::WatchBusy, {m_results}), {}, say(Say::WatchBusyRemedy)});
        }
    }

    /// Contents that were verified before. A result gets its name when it is complete, so its name
    /// is enough. Drafts that a killed run has left are removed.
    void findResults() {
        constexpr auto options = fs::directory_options::skip_permission_denied;
        std::error_code failure;
        for (fs::recursive_directory_iterator at(m_results, options, failure), end;
             !failure && at != end; at.increment(failure)) {
            const std::string name = at->path().filename();
            std::error_code ignored;
            if (const std::string_view mark = markIn(name); !mark.empty()) {
                m_known.emplace(mark);
            } else if (name.starts_with(".tintgate-new-") && at->is_regular_file(ignored) &&
                       fs::file_time_type::clock::now() - at->last_write_time(ignored) >
                           draftsAreStale) {
                fs::remove(at->path(), ignored);
            }
        }
    }

    void addRetries(std::vector<std::string>& paths) {
        const auto now = Clock::now();
        for (auto at = m_again.begin(); at != m_again.end();) {
            if (at->second <= now) {
                paths.push_back(at->first);
                at = m_again.erase(at);
            } else {
                ++at;
            }
        }
        std::sort(paths.begin(), paths.end());
        paths.erase(std::unique(paths.begin(), paths.end()), paths.end());
    }

    bool claim(const std::string& mark) {
        const std::lock_guard lock(m_mutex);
        return m_known.insert(mark).second;
    }

    void tryAgain(const std::string& path, const std::string& mark) {
        const std::lock_guard lock(m_mutex);
        m_known.erase(mark);
        m_again[path] = Clock::now() + m_beforeRetry;
    }

    /// True if this problem of the file was not reported yet. `state` identifies the file's
    /// version.
    bool isNews(const std::string& path, const std::string& state) {
        const std::lock_guard lock(m_mutex);
        return std::exchange(m_reported[path], state) != state;
    }

    Outcome skip(const Measurement& measurement) const {
        Outcome outcome;
        outcome.measurement = measurement;
        outcome.isSkipped = true;
        return outcome;
    }

    Outcome verifyArrival(const Measurement& measurement) {
        const std::string& path = measurement.path;
        const Wanted wanted{.json = m_wanted.json, .result = false};
        struct stat before {};
        if (stat(path.c_str(), &before) != 0) {
            return skip(measurement); // gone again
        }
        std::string bytes;
        const colour::Failure failure = colour::readWholeFile(path, mostBytes, bytes);
        if (failure == colour::Failure::Missing) {
            return skip(measurement);
        }
        if (failure != colour::Failure::None) {
            const int code = failure == colour::Failure::TooLarge      ? exitInputTooLarge
                             : failure == colour::Failure::OutOfMemory ? exitOutOfMemory
                                                                       : exitInputUnreadable;
            Outcome outcome = refuse(m_aim, measurement, code, wanted);
            outcome.isSkipped = !isNews(path, "unreadable " + std::to_string(before.st_mtime) +
                                                  " " + std::to_string(before.st_ctime));
            return outcome;
        }
        struct stat after {};
        if (stat(path.c_str(), &after) != 0 || after.st_size != before.st_size ||
            after.st_mtim.tv_sec != before.st_mtim.tv_sec ||
            after.st_mtim.tv_nsec != before.st_mtim.tv_nsec ||
            bytes.size() != static_cast<std::size_t>(after.st_size)) {
            const std::lock_guard lock(m_mutex); // it is being written: its end will be reported
            m_again[path] = Clock::now() + m_beforeRetry;
            return skip(measurement);
        }
        const std::string mark = sha256(bytes);
        if (!claim(mark)) {
            return skip(measurement);
        }
        Outcome outcome = verifyBytes(m_aim, measurement, bytes, m_outputs, wanted, mark);
        bool isKept = outcome.fate != Fate::NotDone && !outcome.problem;
        if (outcome.fate == Fate::NotDone) {
            isKept = !m_outputs.write(measurement, Output::Broken, brokenJson(m_aim, outcome, mark),
                                      mark);
        }
        if (!isKept) {
            tryAgain(path, mark);
            outcome.isSkipped = !isNews(path, mark);
        }
        return outcome;
    }

    const Aim& m_aim;
    const WatchWanted& m_wanted;
    const std::string m_root;
    const std::string m_results;
    Outputs m_outputs;
    const std::chrono::milliseconds m_beforeRetry;
    base::Descriptor m_lock;
    std::mutex m_mutex;
    std::unordered_set<std::string> m_known;          ///< SHA-256 of contents with a result.
    std::map<std::string, Clock::time_point> m_again; ///< Files to be tried again, and when.
    std::map<std::string, std::string> m_reported;    ///< Files with problems that may pass.
};

} // namespace

void watch(const Aim& aim, const WatchWanted& wanted, const std::function<void()>& start,
           const std::function<bool(const Outcome&)>& emit) {
    Watch(aim, wanted).run(start, emit);
}

} // namespace check
