// The tickets of a store, as a session's container asks for them.
#pragma once

#include <array>
#include <chrono>
#include <cstdint>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "store/StoreEngine.h"
#include "store/tickets/TicketKeep.h"

namespace store {

/// A failure of the store is a ticket that isn't there, or a table that can't be written.
///
/// What was read is given again only while nobody has committed anything since, so a reader sees
/// what is there now. Two things are kept that way: the key that was read last, so that the
/// count and the elements of an array are one fetch; and, once the ids of the jobs have been asked
/// for, the keys of all jobs by which a client picks those that concern it, since it is about to
/// ask each job for each of them.
///
/// A listing is the one thing that may be seen as it was a moment ago: from where a client starts,
/// having asked for the ids, to where it no longer goes on to a further one of these keys or a job
/// of a higher id, what it sees may be as old as oldestListed where asking costs a round trip.
class StoreKeep : public TicketKeep {
  public:
    explicit StoreKeep(std::shared_ptr<StoreEngine> engine);

    std::vector<int> ids(int type) override;
    /// The same, but that a failure of the store is thrown: none is not the same as not known.
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

    static constexpr std::size_t overviewKeys = 5;
    struct Row {
        int id;
        std::array<SharedElements, overviewKeys> elements;
        std::array<bool, overviewKeys> large; ///< Not held for its size.
    };

    bool goesOn(int id, std::size_t overviewKey);
    const Row* overviewRow(int id);
    bool wantsOverview(std::uint64_t commits, bool listing);
    void fetchOverview(std::uint64_t commits);

    const std::shared_ptr<StoreEngine> m_engine;
    Fetched m_fetched;
    std::vector<Row> m_overview;            ///< By id.
    std::size_t m_lastRow = 0;              ///< Jobs are asked for in this order.
    std::pair<int, std::size_t> m_listed{}; ///< Job and overview key that a listing read last.
    std::chrono::steady_clock::time_point m_overviewFetched;
    std::uint64_t m_overviewCommits = 0;
    bool m_overviewHeld = false;
    bool m_idsAsked = false;          ///< Since the last overview.
    std::size_t m_readsSince = 0;     ///< Of keys that an overview would have held.
    std::size_t m_readsUntilNext = 0; ///< An overview is due again after so many.
};

} // namespace store
