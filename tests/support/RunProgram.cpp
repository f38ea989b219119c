#include "RunProgram.h"

#include <array>
#include <cerrno>
#include <cstring>
#include <stdexcept>

#include <fcntl.h>
#include <grp.h>
#include <poll.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

namespace support {

namespace {

using Clock = std::chrono::steady_clock;

struct Pipe {
    int ends[2] = {-1, -1};
    Pipe() {
        if (pipe2(ends, O_CLOEXEC) != 0) {
            throw std::runtime_error("no pipe");
        }
    }
    ~Pipe() {
        closeEnd(0);
        closeEnd(1);
    }
    void closeEnd(int which) {
        if (ends[which] >= 0) {
            close(ends[which]);
        }
        ends[which] = -1;
    }
};

std::vector<std::string>
environmentWith(const std::map<std::string, std::optional<std::string>>& changes) {
    std::vector<std::string> result;
    for (char** entry = environ; *entry != nullptr; ++entry) {
        const std::string text = *entry;
        if (changes.count(text.substr(0, text.find('='))) == 0) {
            result.push_back(text);
        }
    }
    for (const auto& [name, value] : changes) {
        if (value) {
            result.push_back(name + "=" + *value);
        }
    }
    return result;
}

std::vector<char*> pointersTo(std::vector<std::string>& texts) {
    std::vector<char*> pointers;
    for (std::string& text : texts) {
        pointers.push_back(text.data());
    }
    pointers.push_back(nullptr);
    return pointers;
}

[[noreturn]] void refuse(const char* what) {
    dprintf(STDERR_FILENO, "%s: %s\n", what, strerror(errno));
    _exit(127);
}

// In the child. Its group is its own, so that a time limit ends its children too.
[[noreturn]] void become(char* const* arguments, char* const* environment, int output, int error,
                         const RunOptions& options) {
    setpgid(0, 0);
    const int nothing = open("/dev/null", O_RDONLY);
    dup2(nothing, STDIN_FILENO);
    dup2(error, STDERR_FILENO);
    // An ordinary user may not be able to reach the build tree, so the program is opened before.
    int program = -1;
    if (options.user != 0) {
        program = open(arguments[0], O_RDONLY | O_CLOEXEC);
        if (!becomeUser(options.user)) {
            refuse("become another user");
        }
    }
    if (!options.outputPath.empty()) {
        output = open(options.outputPath.c_str(), O_WRONLY | O_CREAT, 0644);
    }
    if (dup2(output, STDOUT_FILENO) < 0) {
        refuse(options.outputPath.c_str());
    }
    if (!options.folder.empty() && chdir(options.folder.c_str()) != 0) {
        refuse(options.folder.c_str());
    }
    if (program >= 0) {
        fexecve(program, arguments, environment);
    } else {
        execvpe(arguments[0], arguments, environment);
    }
    refuse(arguments[0]);
}

bool hasEnded(pid_t child) {
    siginfo_t info = {};
    waitid(P_PID, static_cast<id_t>(child), &info, WEXITED | WNOHANG | WNOWAIT);
    return info.si_pid == child;
}

// Takes in what the program prints until it has ended, whether or not a child that it left behind
// still holds the pipes. False if that takes too long.
bool collect(pid_t child, Pipe& output, Pipe& error, Outcome& outcome, Clock::time_point end) {
    std::array<pollfd, 2> open = {{{output.ends[0], POLLIN, 0}, {error.ends[0], POLLIN, 0}}};
    std::array<std::string*, 2> texts = {&outcome.output, &outcome.error};
    while (Clock::now() < end) {
        // Asked before the pipes are, so that its last words are not missed.
        const bool ended = hasEnded(child);
        const bool closed = open[0].fd < 0 && open[1].fd < 0;
        const int ready = poll(open.data(), open.size(), ended ? 0 : closed ? 1 : 20);
        if (ended && ready == 0) {
            return true;
        }
        for (std::size_t i = 0; i < open.size(); ++i) {
            if (open[i].fd < 0 || open[i].revents == 0) {
                continue;
            }
            char bytes[65536];
            const ssize_t count = read(open[i].fd, bytes, sizeof bytes);
            if (count > 0) {
                texts[i]->append(bytes, static_cast<std::size_t>(count));
            } else {
                open[i].fd = -1;
            }
        }
    }
    return false;
}

} // namespace

Outcome run(const std::vector<std::string>& command, const RunOptions& options) {
    std::vector<std::string> arguments = command;
    std::vector<std::string> environment = environmentWith(options.environment);
    const std::vector<char*> argumentPointers = pointersTo(arguments);
    const std::vector<char*> environmentPointers = pointersTo(environment);
    Pipe output;
    Pipe error;

    const Clock::time_point end = Clock::now() + options.limit;
    const pid_t child = fork();
    if (child < 0) {
        throw std::runtime_error("no process");
    }
    if (child == 0) {
        become(argumentPointers.data(), environmentPointers.data(), output.ends[1], error.ends[1],
               options);
    }
    setpgid(child, child); // Here as well, so that it is done whoever comes first.
    output.closeEnd(1);
    error.closeEnd(1);

    Outcome outcome;
    outcome.timedOut = !collect(child, output, error, outcome, end);
    if (outcome.timedOut) {
        kill(-child, SIGKILL);
    }
    int status = 0;
    waitpid(child, &status, 0);
    if (WIFEXITED(status)) {
        outcome.exitCode = WEXITSTATUS(status);
    } else if (WIFSIGNALED(status)) {
        outcome.signal = WTERMSIG(status);
    }
    return outcome;
}

bool becomeUser(unsigned user) {
    return geteuid() != 0 || (setgroups(0, nullptr) == 0 && setgid(user) == 0 && setuid(user) == 0);
}

void giveTo(unsigned user, const std::string& path) {
    if (geteuid() == 0 && lchown(path.c_str(), user, user) != 0) {
        throw std::runtime_error("can't give away " + path);
    }
}

} // namespace support
