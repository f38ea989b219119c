#include "platform/SystemRoot.h"

#include <cstdlib>

#ifndef TINTGATE_BUILT_IN_ROOT
#define TINTGATE_BUILT_IN_ROOT ""
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

} // namespace

std::string systemRoot() {
    const char* const candidates[] = {std::getenv("TINTGATE_ROOT"), TINTGATE_BUILT_IN_ROOT};
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
