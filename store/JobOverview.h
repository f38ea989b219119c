// SPDX-License-Identifier: Apache-2.0
// The keys by which clients choose jobs, which a store keeps a second time: narrow, and of all jobs
// together.
//
// A client asks every job for each of these keys, so a run's time would grow with all jobs that
// were ever stored if each key were looked up. A store therefore also keeps them in blocks, each
// for 64 ids:
//
//   entry of id 0, entry of id 1, ... entry of id 63
//
// An entry without a job is all zero. The entry of a job:
//
//   01                    there is a job
//   02 d0 00 00 00        Input/SubType: one int, at position 0, little-endian
//   00 00 00 00 00        Job/Display/Status: there is no such key
//   ff 00 00 00 00        Remote/ShowInVerifier: anything else, to be read from the key itself
//   ...                   Input/FileType, Workflow/Verify/Active
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "jobkeys/JobState.h"
#include "jobkeys/Tickets.h"
#include "store/tickets/TicketElements.h"

namespace store {

using jobkeys::jobType;

using jobkeys::overviewKeys;

/// The key's place among these; overviewKeys.size() for any other.
std::size_t overviewKey(std::string_view name);

inline constexpr int jobsOfBlock = 64;
inline constexpr std::size_t slotBytes = 5;
inline constexpr std::size_t entryBytes = 1 + overviewKeys.size() * slotBytes;
inline constexpr std::size_t blockBytes = jobsOfBlock * entryBytes;

constexpr int blockOf(int id) {
    return id / jobsOfBlock;
}
/// Of the job's entry in its block.
constexpr std::size_t entryOffset(int id) {
    return static_cast<std::size_t>(id % jobsOfBlock) * entryBytes;
}
constexpr std::size_t slotOffset(int id, std::size_t key) {
    return entryOffset(id) + 1 + key * slotBytes;
}

/// What stands in a key's slot; null is a key that isn't there.
std::string slotOf(const Elements* elements);

/// The blocks of a store, at one moment.
class JobOverview {
  public:
    void clear();
    /// Blocks come by ascending number. Throws StoreFailure (Damaged) for bytes that make no block.
    void add(int block, std::string_view bytes);

    /// Of all jobs, ascending.
    const std::vector<int>& ids() const { return m_ids; }

    enum class Holds { Nothing, Number, SomethingElse };
    /// What a job's key holds, and if it is a number, that. Nothing for a job that isn't there.
    Holds find(int id, std::size_t key, int& number) const;

  private:
    static constexpr std::size_t none = static_cast<std::size_t>(-1);

    std::string m_bytes;              ///< The blocks that are there, one behind the other.
    std::vector<std::size_t> m_start; ///< By the number of a block: where it starts, or none.
    std::vector<int> m_ids;
};

} // namespace store
