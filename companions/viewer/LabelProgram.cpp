// SPDX-License-Identifier: Apache-2.0
#include "companions/viewer/LabelProgram.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <spawn.h>
#include <sys/mman.h>
#include <unistd.h>
#include <utility>
#include <vector>

#include "base/Descriptor.h"

namespace viewer {
namespace {

constexpr int metaDescriptor = 3; ///< In the child. Its standard input is the result.

/// Creates an anonymous file in memory with these bytes. Its number is one that the child does not
/// use. The descriptor is not open, with errno set, if there is no memory for it.
base::Descriptor inMemory(std::string_view bytes) {
    constexpr int aboveChilds = 10;
    const base::Descriptor low(memfd_create("tintgate", MFD_CLOEXEC));
    base::Descriptor file(low.isOpen() ? fcntl(low.get(), F_DUPFD_CLOEXEC, aboveChilds) : -1);
    const bool isWritten = file.isOpen() && base::writeAll(file, bytes) == bytes.size() &&
                           lseek(file.get(), 0, SEEK_SET) == 0;
    return isWritten ? std::move(file) : base::Descriptor();
}

std::vector<std::string> commandOf(const LabelSettings& settings, const std::string& stem) {
    std::vector<std::string> words = {settings.program, "-",
                                      "--meta=/dev/fd/" + std::to_string(metaDescriptor)};
    if (!settings.label.empty()) {
        words.push_back("--label=" + stem + ".label." + settings.label);
    }
    if (settings.certificate) {
        words.push_back("--pdf=" + stem + ".pdf");
    }
    words.insert(words.end(), settings.options.begin(), settings.options.end());
    return words;
}

} // namespace

bool startLabelProgram(const LabelSettings& settings, const std::string& page,
                       const LabelInput& input, std::string& problem) {
    const base::Descriptor result = inMemory(input.result);
    const base::Descriptor meta = inMemory(input.meta);
    if (!result.isOpen() || !meta.isOpen()) {
        problem = std::strerror(errno);
        return false;
    }
    const std::string stem = page.substr(0, page.size() - std::strlen(".html"));
    const std::string log = stem + ".label.log";
    std::vector<std::string> words = commandOf(settings, stem);
    std::vector<char*> arguments;
    for (std::string& word : words) {
        arguments.push_back(word.data());
    }
    arguments.push_back(nullptr);

    posix_spawn_file_actions_t files;
    posix_spawn_file_actions_init(&files);
    // The program may outlive our caller, so it must not keep the caller's pipes open.
    posix_spawn_file_actions_adddup2(&files, result.get(), STDIN_FILENO);
    posix_spawn_file_actions_addopen(&files, STDOUT_FILENO, "/dev/null", O_RDWR, 0);
    posix_spawn_file_actions_addopen(&files, STDERR_FILENO, log.c_str(),
                                     O_WRONLY | O_CREAT | O_TRUNC | O_NOFOLLOW, 0666);
    posix_spawn_file_actions_adddup2(&files, meta.get(), metaDescriptor);
    posix_spawnattr_t attributes;
    posix_spawnattr_init(&attributes);
    posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSID);
    pid_t process = 0;
    const int reason =
        posix_spawnp(&process, words[0].c_str(), &files, &attributes, arguments.data(), environ);
    posix_spawnattr_destroy(&attributes);
    posix_spawn_file_actions_destroy(&files);
    if (reason != 0) {
        problem = settings.program + ": " + std::strerror(reason);
    }
    return reason == 0;
}

} // namespace viewer
