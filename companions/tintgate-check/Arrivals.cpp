// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Arrivals.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <chrono>
#include <cstddef>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <map>
#include <system_error>
#include <utility>

#include <poll.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <unistd.h>

#include "companions/tintgate-check/Measurements.h"
#include "companions/tintgate-check/Problem.h"
#include "companions/tintgate-check/Words.h"

namespace check {
namespace {

namespace fs = std::filesystem;

/// What changes when a file is written to or replaced.
struct State {
    dev_t device = 0;
    ino_t number = 0;
    off_t size = 0;
    timespec time{};

    bool operator==(const State& other) const {
        return device == other.device && number == other.number && size == other.size &&
               time.tv_sec == other.time.tv_sec && time.tv_nsec == other.time.tv_nsec;
    }
};

bool stateOf(const std::string& path, State& state) {
    struct stat status {};
    if (stat(path.c_str(), &status) != 0 || !S_ISREG(status.st_mode)) {
        return false;
    }
    state = {status.st_dev, status.st_ino, status.st_size, status.st_mtim};
    return true;
}

/// Files whose end nobody reports: complete after two rounds without a change.
class Settling {
  public:
    /// A file that is there, or has changed.
    void note(const std::string& path) {
        State state;
        if (stateOf(path, state)) {
            Entry& entry = m_entries[path];
            entry.isSeen = true;
            if (!(entry.state == state)) {
                entry = {state, 0, true, false};
            }
        }
    }

    void forget(const std::string& path) { m_entries.erase(path); }

    /// Ends a round: those that are complete now. `keep`: remember them, so that they do not come
    /// again before they change; otherwise they are forgotten.
    std::vector<std::string> endRound(bool keep) {
        std::vector<std::string> complete;
        for (auto at = m_entries.begin(); at != m_entries.end();) {
            auto& [path, entry] = *at;
            State state;
            bool isGone = !std::exchange(entry.isSeen, !keep) || !stateOf(path, state);
            if (!isGone && !entry.isDone) {
                entry.rounds = entry.state == state ? entry.rounds + 1 : 0;
                entry.state = state;
                if (entry.rounds >= roundsWithoutChange) {
                    complete.push_back(path);
                    entry.isDone = true;
                    isGone = !keep;
                }
            }
            at = isGone ? m_entries.erase(at) : std::next(at);
        }
        return complete;
    }

    bool isEmpty() const { return m_entries.empty(); }

  private:
    static constexpr int roundsWithoutChange = 2;

    struct Entry {
        State state;
        int rounds = 0;
        bool isSeen = true; ///< In this round.
        bool isDone = false;
    };

    std::map<std::string, Entry> m_entries;
};

/// Calls `file` for each measurement below a folder, and `folder` for it and each folder below.
template<class File, class Folder>
void walk(const std::string& path, File file, Folder folder) {
    folder(path);
    std::error_code failure;
    for (fs::directory_iterator at(path, failure), end; !failure && at != end;
         at.increment(failure)) {
        std::error_code ignored;
        const std::string name = at->path().filename();
        if (name.starts_with('.')) {
            continue;
        }
        if (at->symlink_status(ignored).type() == fs::file_type::directory) {
            walk(at->path(), file, folder);
        } else if (looksLikeMeasurement(name)) {
            file(at->path());
        }
    }
}

/// Waits for a descriptor (or -1), for the signal, or for so many milliseconds.
void waitFor(int descriptor, const StopSignal& stop, int milliseconds) {
    std::array<pollfd, 2> files{{{stop.descriptor(), POLLIN, 0}, {descriptor, POLLIN, 0}}};
    poll(files.data(), files.size(), milliseconds);
}

int millisecondsOf(double seconds) {
    constexpr int perSecond = 1000;
    return static_cast<int>(seconds * perSecond);
}

class NotifiedArrivals : public Arrivals {
  public:
    NotifiedArrivals(const std::string& folder, double interval)
        : m_folder(folder), m_interval(millisecondsOf(interval)),
          m_file(inotify_init1(IN_CLOEXEC | IN_NONBLOCK)) {
        if (!m_file.isOpen()) {
            fail(errno);
        }
        add(folder);
    }

    std::vector<std::string> wait(const StopSignal& stop) override {
        const auto now = Clock::now();
        const auto left =
            std::chrono::duration_cast<std::chrono::milliseconds>(m_round - now).count();
        waitFor(m_file.get(), stop,
                m_settling.isEmpty() ? m_interval
                                     : static_cast<int>(std::clamp<long>(left, 0, m_interval)));
        std::vector<std::string> complete;
        readEvents(complete);
        if (!m_settling.isEmpty() && Clock::now() >= m_round) {
            const auto settled = m_settling.endRound(false);
            complete.insert(complete.end(), settled.begin(), settled.end());
            m_round = Clock::now() + std::chrono::milliseconds(m_interval);
        }
        // A file that is written piece by piece may have been closed several times by now.
        std::sort(complete.begin(), complete.end());
        complete.erase(std::unique(complete.begin(), complete.end()), complete.end());
        return complete;
    }

  private:
    using Clock = std::chrono::steady_clock;

    [[noreturn]] void fail(int reason) const {
        throw Failure(Status::NotDone,
                      {0,
                       say(Say::WatchNotPossible, {m_folder, std::strerror(reason)}),
                       {},
                       say(Say::WatchNotPossibleRemedy)});
    }

    /// Watches a folder and all below, then notes what is there: what comes meanwhile is reported.
    void add(const std::string& folder) {
        if (m_settling.isEmpty()) {
            m_round = Clock::now() + std::chrono::milliseconds(m_interval);
        }
        walk(
            folder, [&](const std::string& path) { m_settling.note(path); },
            [&](const std::string& path) {
                const int number = inotify_add_watch(m_file.get(), path.c_str(),
                                                     IN_CLOSE_WRITE | IN_MOVED_TO | IN_CREATE |
                                                         IN_MOVE_SELF | IN_ONLYDIR);
                if (number >= 0) {
                    m_folders[number] = path;
                } else if (errno != ENOENT && errno != ENOTDIR && errno != EACCES) {
                    fail(errno);
                }
            });
    }

    void readEvents(std::vector<std::string>& complete) {
        alignas(inotify_event) std::array<char, 65536> buffer;
        while (true) {
            const ssize_t count = read(m_file.get(), buffer.data(), buffer.size());
            if (count <= 0) {
                return;
            }
            for (const char* at = buffer.data(); at < buffer.data() + count;) {
                const auto* const event = reinterpret_cast<const inotify_event*>(at);
                handle(*event, complete);
                at += sizeof(inotify_event) + event->len;
            }
        }
    }

    void handle(const inotify_event& event, std::vector<std::string>& complete) {
        if ((event.mask & IN_Q_OVERFLOW) != 0) {
            std::fprintf(stderr, "tintgate-check: %s\n", say(Say::WatchLost).c_str());
            return add(m_folder);
        }
        const auto found = m_folders.find(event.wd);
        if (found == m_folders.end()) {
            return;
        }
        const std::string folder = found->second;
        if ((event.mask & (IN_IGNORED | IN_UNMOUNT | IN_MOVE_SELF)) != 0) {
            if (folder == m_folder) {
                throw Failure(Status::NotDone, {0,
                                                say(Say::WatchFolderGone, {m_folder}),
                                                {},
                                                say(Say::WatchFolderGoneRemedy)});
            }
            // A folder that moved within the tree is reported where it arrives, too.
            if ((event.mask & IN_MOVE_SELF) == 0) {
                m_folders.erase(found);
            }
            return;
        }
        const std::string name = event.len > 0 ? event.name : "";
        const std::string path = folder + "/" + name;
        if (name.empty() || name.starts_with('.')) {
            return;
        }
        if ((event.mask & IN_ISDIR) != 0) {
            return add(path);
        }
        if (!looksLikeMeasurement(name)) {
            return;
        }
        if ((event.mask & IN_CREATE) != 0) {
            // The end of its writing is reported, unless it is another name of a file.
            struct stat status {};
            if (lstat(path.c_str(), &status) == 0 &&
                (S_ISLNK(status.st_mode) || status.st_nlink > 1)) {
                m_settling.note(path);
            }
            return;
        }
        m_settling.forget(path);
        complete.push_back(path);
    }

    const std::string m_folder;
    const int m_interval;
    base::Descriptor m_file;
    std::map<int, std::string> m_folders; ///< By the number of their watch.
    Settling m_settling;
    Clock::time_point m_round; ///< When the current round ends; without meaning if none is needed.
};

class PolledArrivals : public Arrivals {
  public:
    PolledArrivals(std::string folder, double interval)
        : m_folder(std::move(folder)), m_interval(millisecondsOf(interval)) {}

    std::vector<std::string> wait(const StopSignal& stop) override {
        waitFor(-1, stop, m_interval);
        std::error_code ignored;
        const bool isThere = fs::is_directory(m_folder, ignored);
        if (!isThere && m_wasThere) {
            std::fprintf(stderr, "tintgate-check: %s\n",
                         say(Say::WatchFolderGone, {m_folder}).c_str());
        }
        m_wasThere = isThere;
        if (!isThere) {
            return {}; // what is known of the files stays true while a share is away
        }
        walk(
            m_folder, [&](const std::string& path) { m_settling.note(path); },
            [](const std::string&) {});
        return m_settling.endRound(true);
    }

  private:
    const std::string m_folder;
    const int m_interval;
    Settling m_settling;
    bool m_wasThere = true;
};

} // namespace

std::unique_ptr<Arrivals> notifiedArrivals(const std::string& folder, double interval) {
    return std::make_unique<NotifiedArrivals>(folder, interval);
}

std::unique_ptr<Arrivals> polledArrivals(const std::string& folder, double interval) {
    return std::make_unique<PolledArrivals>(folder, interval);
}

} // namespace check
