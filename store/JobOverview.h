// SPDX-License-Identifier: Apache-2.0
// A compact second copy of the keys by which clients select jobs, for all jobs of a store.
//
// A client reads each of these keys for every job. If each key were looked up, a run's time would
// grow with the number of all jobs ever stored. So a store also keeps them in blocks of 64 ids
// each:
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

/// Index of the key among these; overviewKeys.size() for any other.
std::size_t overviewKey(std::string_view name);

inline constexpr int jobsOfBlock = 64;
inline constexpr std::size_t slotBytes = 5;
inline constexpr std::size_t entryBytes = 1 + overviewKeys.size() * slotBytes;
inline constexpr std::size_t blockBytes = jobsOfBlock * entryBytes;

constexpr int blockOf(int id) {
    return id / jobsOfBlock;
}
/// Offset of the job's entry in its block.
constexpr std::size_t entryOffset(int id) {
    return static_cast<std::size_t>(id % jobsOfBlock) * entryBytes;
}
constexpr std::size_t slotOffset(int id, std::size_t key) {
    return entryOffset(id) + 1 + key * slotBytes;
}

/// The content of a key's slot; null means a missing key.
std::string slotOf(const Elements* elements);

/// The blocks of a store at one moment.
class JobOverview {
  public:
    void clear();
    /// Blocks must be added by ascending number. Throws StoreFailure (Damaged) for invalid bytes.
    void add(int block, std::string_view bytes);

    /// All jobs, ascending.
    const std::vector<int>& ids() const { return m_ids; }

    enum class Holds { Nothing, Number, SomethingElse };
    /// The kind of a job's key and, if it is a number, its value. Nothing for a missing job.
    Holds find(int id, std::size_t key, int& number) const;

  private:
    static constexpr std::size_t none = static_cast<std::size_t>(-1);

    std::string m_bytes;              ///< All existing blocks, one after the other.
    std::vector<std::size_t> m_start; ///< Start of a block by its number, or none.
    std::vector<int> m_ids;
};

} // namespace store
