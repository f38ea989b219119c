// SPDX-License-Identifier: Apache-2.0
#include "platform/SystemRoot.h"

#include <cstdlib>
#include <filesystem>
#include <system_error>

#ifndef TINTGATE_BUILT_IN_ROOT
#define TINTGATE_BUILT_IN_ROOT ""
#endif
#ifndef TINTGATE_INSTALLED_ROOT
#define TINTGATE_INSTALLED_ROOT "lib/tintgate/root"
#endif

namespace platform {

namespace {

bool isUsable(const char* root) {
    return root != nullptr && *root != '\0' &&
           std::string(root).find_first_of("\"'$`\\") == std::string::npos;
}

std::string withoutSlashAtEnd(std::string root) {
    root.erase(root.find_last_not_of('/') + 1);
    return root;
}

// PREFIX/lib/tintgate/root for a program in PREFIX/bin, or the root that contains the program.
std::string findInstalledRoot() {
    namespace fs = std::filesystem;
    std::error_code error;
    const auto isRoot = [&](const fs::path& folder) {
        return fs::exists(folder / "Library/Preferences/ApplicationsUsingNerovaMeasure_x64.plist",
                          error);
    };
    const fs::path folder = fs::read_symlink("/proc/self/exe", error).parent_path();
    if (const fs::path beside = folder.parent_path() / TINTGATE_INSTALLED_ROOT; isRoot(beside)) {
        return beside.native();
    }
    for (fs::path above = folder; above.has_relative_path(); above = above.parent_path()) {
        if (isRoot(above)) {
            return above.native();
        }
    }
    return {};
}

} // namespace

std::string systemRoot() {
    static const std::string installed = findInstalledRoot();
    const char* const candidates[] = {std::getenv("TINTGATE_ROOT"), TINTGATE_BUILT_IN_ROOT,
                                      installed.c_str()};
    for (const char* root : candidates) {
        if (isUsable(root)) {
            return withoutSlashAtEnd(root);
        }
    }
    return {};
}

std::string underRoot(const char* literal) {
    return systemRoot() + literal;
}

} // namespace platform
