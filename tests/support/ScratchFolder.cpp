// SPDX-License-Identifier: Apache-2.0
#include "ScratchFolder.h"

#include <cstdlib>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <system_error>

#include <sys/stat.h>

namespace support {

ScratchFolder::ScratchFolder() {
    // In /tmp instead of the build tree, to which an ordinary user may have no access.
    char path[] = "/tmp/tintgate-test-XXXXXX";
    if (mkdtemp(path) == nullptr) {
        throw std::runtime_error("no scratch folder");
    }
    m_path = path;
}

ScratchFolder::~ScratchFolder() {
    std::error_code ignored;
    std::filesystem::remove_all(m_path, ignored);
}

std::string ScratchFolder::write(const std::string& name, const std::string& contents) const {
    std::filesystem::create_directories(std::filesystem::path(path(name)).parent_path());
    std::ofstream(path(name)) << contents;
    return path(name);
}

std::string ScratchFolder::makeFolder(const std::string& name) const {
    std::filesystem::create_directories(path(name));
    return path(name);
}

std::string contentsOf(const std::string& path) {
    std::ifstream file(path);
    if (!file) {
        throw std::runtime_error("no file " + path);
    }
    return {std::istreambuf_iterator<char>(file), {}};
}

bool exists(const std::string& path) {
    struct stat status;
    return lstat(path.c_str(), &status) == 0;
}

unsigned modeOf(const std::string& path) {
    struct stat status;
    return lstat(path.c_str(), &status) == 0 ? status.st_mode & 07777u : 0u;
}

} // namespace support
