// SPDX-License-Identifier: Apache-2.0
#include "RunProgram.h"

#include <cerrno>
#include <cstring>
#include <stdexcept>

#include <fcntl.h>
#include <grp.h>
#include <poll.h>
#include <signal.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

extern "C" { // The header itself lacks this.
#include <sys/pidfd.h>
}

namespace support {

namespace {

/// A file in memory for a program's output. Unlike a pipe, it never fills up and is not kept open
/// by a child that the program leaves behind.
class Printed {
  public:
    Printed() : descriptor(memfd_create("printed", MFD_CLOEXEC)) {
        if (descriptor < 0) {
            throw std::runtime_error("no file in memory");
        }
    }
    ~Printed() { close(descriptor); }
    Printed(const Printed&) = delete;

    std::string text() const {
        std::string text(static_cast<std::size_t>(lseek(descriptor, 0, SEEK_END)), '\0');
        text.resize(static_cast<std::size_t>(pread(descriptor, text.data(), text.size(), 0)));
        return text;
    }

    const int descriptor;
};

[[noreturn]] void refuse(const char* what) {
    dprintf(STDERR_FILENO, "%s: %s\n", what, strerror(errno));
    _exit(127);
}

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

// Runs in the child, which must not allocate: another thread may have held the heap's lock at the
// fork. It gets its own process group, so that a time limit ends its children too.
[[noreturn]] void become(char* const* arguments, char* const* environment, int output, int error,
                         const RunOptions& options) {
    setpgid(0, 0);
    dup2(open("/dev/null", O_RDONLY), STDIN_FILENO);
    dup2(error, STDERR_FILENO);
    // An ordinary user may not have access to the build tree, so the program is opened first.
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

} // namespace

Outcome run(const std::vector<std::string>& command, const RunOptions& options) {
    std::vector<std::string> words = command;
    std::vector<std::string> environment = environmentWith(options.environment);
    const std::vector<char*> arguments = pointersTo(words);
    const std::vector<char*> variables = pointersTo(environment);
    const Printed output;
    const Printed error;
    const pid_t child = fork();
    if (child < 0) {
        throw std::runtime_error("no process");
    }
    if (child == 0) {
        become(arguments.data(), variables.data(), output.descriptor, error.descriptor, options);
    }
    setpgid(child, child); // Done in both processes, in any order.

    Outcome outcome;
    outcome.timedOut = !awaitEnd(child, options.limit);
    if (outcome.timedOut) {
        kill(-child, SIGKILL);
    }
    int status = 0;
    waitpid(child, &status, 0);
    if (WIFEXITED(status)) {
        outcome.exitCode = WEXITSTATUS(status);
    } else {
        outcome.signal = WTERMSIG(status);
    }
    outcome.output = output.text();
    outcome.error = error.text();
    return outcome;
}

bool awaitEnd(pid_t process, std::chrono::milliseconds limit) {
    const int descriptor = pidfd_open(process, 0);
    pollfd ended = {descriptor, POLLIN, 0};
    const int ready = poll(&ended, 1, static_cast<int>(limit.count()));
    close(descriptor);
    return ready == 1;
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
