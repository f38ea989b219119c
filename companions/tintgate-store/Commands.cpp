// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/Commands.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>

#include <unistd.h>

#include "base/Utf8.h"
#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Failure.h"

namespace admin {

namespace {

std::int64_t milliseconds() {
    return std::chrono::duration_cast<std::chrono::milliseconds>(
               std::chrono::steady_clock::now().time_since_epoch())
        .count();
}

} // namespace

const std::string& Invocation::givenAddress() const {
    if (address.empty()) {
        throw Failure(Status::BadCommand,
                      "no store: use --store FOLDER or --store SERVICE, or set TINTGATE_STORE");
    }
    return address;
}

std::unique_ptr<store::StoreEngine> Invocation::open() const {
    return store::openStore(givenAddress(), store::Access::Read);
}

std::string completeAddress(const std::string& typed) {
    constexpr std::size_t longestAddress = 127; // Limit of a job's argument.
    std::error_code none;
    const std::string address =
        typed.find('/') == std::string::npos
            ? typed
            : std::filesystem::absolute(typed, none).lexically_normal().string();
    if (address.size() > longestAddress) {
        std::fprintf(stderr,
                     "tintgate-store: warning: the store's address has %zu bytes; a job can use "
                     "at most %zu\n",
                     address.size(), longestAddress);
    }
    // A login passes one byte per character. Lead bytes from C4 up start characters above U+00FF.
    const bool isLatin1 =
        base::isUtf8(address) &&
        std::all_of(address.begin(), address.end(), [](unsigned char byte) { return byte < 0xC4; });
    if (!isLatin1) {
        std::fprintf(stderr, "tintgate-store: warning: the store's address has characters that a "
                             "job can't use; its run ends with 150\n");
    }
    return address;
}

Progress::Progress(std::size_t total, std::string what)
    : m_total(total), m_what(std::move(what)), m_shown(isatty(STDERR_FILENO) != 0) {}

Progress::~Progress() {
    if (m_shown && m_last != 0) {
        std::fputs("\r\x1b[K", stderr);
    }
}

void Progress::done(std::size_t count, std::size_t total) {
    const std::int64_t now = milliseconds();
    if (m_shown && now - m_last >= 100) {
        m_last = now;
        std::fprintf(stderr, "\r%zu of %zu %s\x1b[K", count, total, m_what.c_str());
    }
}

} // namespace admin
