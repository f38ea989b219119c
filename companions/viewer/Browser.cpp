// SPDX-License-Identifier: Apache-2.0
#include "companions/viewer/Browser.h"

#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <spawn.h>
#include <unistd.h>

namespace viewer {
namespace {

bool isSet(const char* variable) {
    const char* const value = std::getenv(variable);
    return value != nullptr && *value != '\0';
}

} // namespace

bool hasDisplay() {
    return isSet("DISPLAY") || isSet("WAYLAND_DISPLAY");
}

bool openFile(const std::string& path, std::string& problem) {
    // The browser may outlive the caller, so it must not keep the caller's pipes open.
    posix_spawn_file_actions_t files;
    posix_spawn_file_actions_init(&files);
    for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
        posix_spawn_file_actions_addopen(&files, stream, "/dev/null", O_RDWR, 0);
    }
    posix_spawnattr_t attributes;
    posix_spawnattr_init(&attributes);
    posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSID);

    std::string program = "xdg-open";
    std::string file = path;
    char* const arguments[] = {program.data(), file.data(), nullptr};
    pid_t process = 0;
    const int reason =
        posix_spawnp(&process, program.c_str(), &files, &attributes, arguments, environ);
    posix_spawnattr_destroy(&attributes);
    posix_spawn_file_actions_destroy(&files);
    if (reason != 0) {
        problem = program + ": " + std::strerror(reason);
    }
    return reason == 0;
}

} // namespace viewer
