// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/Spool.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <iterator>
#include <string>

#include <unistd.h>

#include "companions/tintgate-store/Failure.h"

namespace admin {

Spool::Spool() {
    std::string path = std::filesystem::temp_directory_path() / "tintgate-store-XXXXXX";
    const int file = mkstemp(path.data());
    if (file >= 0) {
        m_stream.open(path, std::ios::in | std::ios::out | std::ios::binary);
        unlink(path.c_str());
        close(file);
    }
    if (!m_stream.is_open()) {
        throw Failure(Status::LocalFile,
                      path + " can't be written: " + std::string(std::strerror(errno)));
    }
}

std::istream& Spool::toRead() {
    if (!m_stream.flush()) {
        throw Failure(Status::LocalFile, "a temporary file can't be written");
    }
    m_stream.seekg(0);
    return m_stream;
}

bool areEqual(Spool& one, Spool& other) {
    const std::istreambuf_iterator<char> end;
    return std::equal(std::istreambuf_iterator<char>(one.toRead()), end,
                      std::istreambuf_iterator<char>(other.toRead()), end);
}

} // namespace admin
