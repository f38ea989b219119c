// SPDX-License-Identifier: Apache-2.0
#include "store/sqlite/WalWatch.h"

#include <atomic>

namespace store {

namespace {

constexpr std::uint32_t indexVersion = 3'007'000; // First word of the header since SQLite 3.7.0.
constexpr int regionSize = 32'768;

const volatile std::uint32_t* sharedHeader(sqlite3* database) {
    sqlite3_file* file = nullptr;
    if (sqlite3_file_control(database, "main", SQLITE_FCNTL_FILE_POINTER, &file) != SQLITE_OK ||
        file == nullptr || file->pMethods == nullptr || file->pMethods->iVersion < 2 ||
        file->pMethods->xShmMap == nullptr) {
        return nullptr;
    }
    volatile void* region = nullptr;
    if (file->pMethods->xShmMap(file, 0, regionSize, 0, &region) != SQLITE_OK ||
        region == nullptr) {
        return nullptr;
    }
    const auto* const header = static_cast<const volatile std::uint32_t*>(region);
    return header[0] == indexVersion ? header : nullptr;
}

} // namespace

WalWatch::WalWatch(sqlite::Database& database, bool shared)
    : m_shared(shared ? sharedHeader(database.get()) : nullptr), m_database(database) {
    if (m_shared == nullptr) {
        m_pragma.emplace(database, "PRAGMA data_version");
    }
}

std::uint64_t WalWatch::commits() {
    if (m_shared == nullptr) {
        auto run = m_pragma->run();
        const std::int64_t version = run.step() ? run.number(0) : 0;
        const std::int64_t ownChanges = sqlite3_total_changes64(m_database.get());
        if (version != m_version || ownChanges != m_ownChanges) {
            m_version = version;
            m_ownChanges = ownChanges;
            ++m_commits;
        }
        return m_commits;
    }
    bool same = true;
    for (std::size_t i = 0; i < m_seen.size(); ++i) {
        const std::uint32_t word = m_shared[i];
        same = same && word == m_seen[i];
        m_seen[i] = word;
    }
    std::atomic_thread_fence(std::memory_order_acquire);
    m_commits += same ? 0 : 1;
    return m_commits;
}

} // namespace store
