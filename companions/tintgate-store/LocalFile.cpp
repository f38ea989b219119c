// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/LocalFile.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <iostream>

#include "base/FileDraft.h"
#include "base/WholeFile.h"
#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Failure.h"

namespace admin {

namespace {

namespace fs = std::filesystem;

[[noreturn]] void fail(const std::string& path, const char* what) {
    const std::string reason = errno != 0 ? std::string(": ") + std::strerror(errno) : "";
    throw Failure(Status::LocalFile, printable(path) + " can't be " + what + reason);
}

void writeTo(const std::string& file, const std::string& shown,
             const std::function<void(std::ostream&)>& write) {
    errno = 0;
    std::ofstream stream(file, std::ios::binary);
    if (!stream) {
        fail(shown, "written");
    }
    write(stream);
    errno = 0;
    stream.close();
    if (!stream) {
        fail(shown, "written");
    }
}

} // namespace

LocalInput::LocalInput(const std::string& path) : m_standardInput(path == "-") {
    if (m_standardInput) {
        return;
    }
    errno = 0;
    m_file.open(path, std::ios::binary);
    if (m_file && fs::is_directory(path)) {
        errno = EISDIR;
        m_file.close();
        fail(path, "read");
    }
    if (!m_file) {
        fail(path, "read");
    }
}

std::istream& LocalInput::stream() {
    return m_standardInput ? std::cin : m_file;
}

void writeLocalFile(const std::string& path, const std::function<void(std::ostream&)>& write) {
    if (path == "-") {
        write(std::cout);
        return;
    }
    std::error_code ignored;
    const auto kind = fs::status(path, ignored).type();
    if (kind != fs::file_type::not_found && kind != fs::file_type::regular) {
        writeTo(path, path, write);
        return;
    }
    const std::string target = base::withoutLinks(path);
    base::FileDraft draft(target);
    if (!draft.isOpen()) {
        fail(path, "written");
    }
    writeTo(draft.path(), path, write);
    if (!draft.keepAccessOf(target) || !draft.replace(target)) {
        fail(path, "written");
    }
}

void finishStandardOutput() {
    errno = 0;
    std::cout.flush();
    if (!std::cout) {
        fail("standard output", "written");
    }
}

} // namespace admin
