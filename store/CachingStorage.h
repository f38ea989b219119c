// SPDX-License-Identifier: Apache-2.0
// The tickets of a store for a session's container.
#pragma once

#include <array>
#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <set>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

#include "store/JobOverview.h"
#include "store/StoreEngine.h"
#include "store/tickets/TicketStorage.h"

namespace store {

/// A failure of the store appears as a missing ticket or as a refused table.
///
/// If the store could not perform a write (busy, lost, full, damaged, out of memory), all later
/// writes to that ticket fail during this object's lifetime. A client writes the keys that complete
/// a job last, so a job with a gap never looks complete. Refusals by the rules of tickets are not
/// failures of the store.
///
/// A cached value is used only if nobody has committed since, so readers always see the current
/// state. Two things are cached: the key read last, so that the count and the elements of an array
/// need one fetch; and, after the ids of the jobs were requested, the overview of all jobs, because
/// a client then reads each of its keys for each job.
///
/// While a client lists jobs (it has asked for the ids and now reads these keys job by job), values
/// may be up to oldestListed old if asking costs a round trip. Every other read sees the latest
/// commit.
class CachingStorage : public TicketStorage {
  public:
    /// Called with each key that a table or a transfer did not write, and the reason, for people.
    using NoteFailure =
        std::function<void(int type, int id, const std::string& key, const std::string& reason)>;

    explicit CachingStorage(std::shared_ptr<StoreEngine> engine, NoteFailure note = {});

    std::vector<int> ids(int type) override;
    /// Same, but throws a failure of the store: no ids is not the same as unknown ids.
    std::vector<int> listIds(int type);
    bool exists(int type, int id) override;
    bool create(int type, int id) override;
    int createNext(int type) override;
    bool remove(int type, int id) override;
    std::shared_ptr<const Elements> key(int type, int id, std::string_view key) override;
    std::shared_ptr<const TicketContent> content(int type, int id,
                                                 const KeyFilter& filter) override;
    bool apply(int type, int id, SETMULTIPAR* table) override;
    bool transfer(int type, int id, const TicketContent& source, bool replace) override;

    static constexpr std::chrono::milliseconds oldestListed{100};

  private:
    using SharedElements = std::shared_ptr<const Elements>;

    struct Fetched {
        int type = -1;
        int id = -1;
        std::string key;
        SharedElements elements;
        std::uint64_t commits = 0;
    };

    template<class Keys, class Write>
    bool write(int type, int id, Keys keys, Write write);
    bool goesOn(int id, std::size_t overviewKey);
    bool wantsOverview(std::uint64_t commits, bool listing);
    void fetchOverview(std::uint64_t commits);
    const SharedElements& elementsOf(std::size_t key, int number);

    const std::shared_ptr<StoreEngine> m_engine;
    const NoteFailure m_note;
    std::set<std::pair<int, int>> m_cutOff; ///< Types and ids of tickets with a lost write.
    Fetched m_fetched;
    JobOverview m_overview;
    std::unordered_map<int, SharedElements> m_numbers; ///< The distinct numbers in the overview.
    /// For each key, the number read last, which is usually the next job's too.
    std::array<std::pair<int, SharedElements>, overviewKeys.size()> m_lastNumbers;
    std::pair<int, std::size_t> m_listed{}; ///< Job and overview key last read in a listing.
    std::chrono::steady_clock::time_point m_overviewFetched;
    std::uint64_t m_overviewCommits = 0;
    bool m_overviewHeld = false;
    std::size_t m_readsSince = 0;      ///< Reads of keys that an overview would contain.
    std::size_t m_readsUntilNext = 20; ///< An overview is fetched after this many.
};

} // namespace store
