#include "store/StoreKeep.h"

#include <algorithm>
#include <limits>
#include <utility>

namespace store {

namespace {

constexpr int jobType = 3;

// Places in a listing: in front of all, and where none is under way.
constexpr std::pair listingStarts = {-1, std::size_t{0}};
constexpr std::pair notListing = {std::numeric_limits<int>::max(), std::size_t{0}};

/// In the order in which a client reads them.
const std::vector<std::string> jobOverview = {"Input/SubType", "Job/Display/Status",
                                              "Remote/ShowInVerifier", "Input/FileType",
                                              "Workflow/Verify/Active"};

/// Room for a number or a few; whoever put more there has it read singly.
constexpr std::size_t largestOverviewBytes = 64;

template<class Body, class Result>
Result orElse(Result otherwise, Body body) {
    try {
        return body();
    } catch (const StoreFailure&) {
        return otherwise;
    }
}

/// Whether a record, as the first one of its key, leaves nothing of what the key held.
bool replacesKey(const SETMULTIPAR& record) {
    if (record.position != POSITION_WHOLE) {
        return false;
    }
    switch (record.type) {
    case PARAM_DELETE:
    case PARAM_POINTER:
        return true;
    case PARAM_INT:
    case PARAM_DOUBLE:
    case PARAM_STRING:
    case PARAM_INT64:
    case PARAM_UINT:
    case PARAM_UINT64:
        return record.value != nullptr;
    default:
        return false;
    }
}

Scope scopeOf(const SETMULTIPAR* table) {
    Scope scope;
    const char* last = nullptr;
    for (const auto* record = table; record->key != nullptr; ++record) {
        if (record->key != last) {
            last = record->key;
            scope.keys.try_emplace(last, !replacesKey(*record));
        }
    }
    return scope;
}

void clearResults(SETMULTIPAR* table) {
    for (; table->key != nullptr; ++table) {
        table->result = 0;
    }
}

} // namespace

StoreKeep::StoreKeep(std::shared_ptr<StoreEngine> engine) : m_engine(std::move(engine)) {}

std::vector<int> StoreKeep::ids(int type) {
    return orElse(std::vector<int>(), [&] { return listIds(type); });
}

std::vector<int> StoreKeep::listIds(int type) {
    if (type == jobType) {
        m_idsAsked = true;
        m_listed = listingStarts;
    }
    return m_engine->ids(type);
}

bool StoreKeep::exists(int type, int id) {
    return orElse(false, [&] { return m_engine->exists(type, id); });
}

bool StoreKeep::create(int type, int id) {
    return orElse(false, [&] { return m_engine->create(type, id); });
}

int StoreKeep::createNext(int type) {
    return orElse(-1, [&] { return m_engine->createNext(type); });
}

bool StoreKeep::remove(int type, int id) {
    return orElse(false, [&] { return m_engine->remove(type, id); });
}

std::shared_ptr<const Elements> StoreKeep::key(int type, int id, std::string_view key) {
    return orElse(SharedElements(), [&] {
        const auto name = type != jobType ? jobOverview.end()
                                          : std::find(jobOverview.begin(), jobOverview.end(), key);
        const auto index = static_cast<std::size_t>(name - jobOverview.begin());
        const bool again = id == m_fetched.id && type == m_fetched.type && key == m_fetched.key;
        const bool listing = index != overviewKeys && goesOn(id, index);
        // Asked before the store is: what is committed in between makes the next read fetch again.
        const std::uint64_t commits =
            m_engine->commits(listing ? oldestListed : std::chrono::milliseconds(0));
        if (again && commits == m_fetched.commits) {
            return m_fetched.elements;
        }
        if (index != overviewKeys && wantsOverview(commits, listing)) {
            const Row* const row = overviewRow(id);
            if (row == nullptr) {
                return SharedElements();
            }
            if (!row->large[index]) {
                return row->elements[index];
            }
        }
        m_fetched.type = -1;
        m_fetched.elements = m_engine->key(type, id, key);
        m_fetched.key = key;
        m_fetched.id = id;
        m_fetched.type = type;
        m_fetched.commits = commits;
        return m_fetched.elements;
    });
}

/// Whether a read of the overview goes on in a listing, behind its first one.
bool StoreKeep::goesOn(int id, std::size_t overviewKey) {
    const std::pair next = {id, overviewKey};
    const bool starts = m_listed == listingStarts;
    const bool goesOn = !starts && m_listed < next;
    m_listed = starts || goesOn ? next : notListing;
    return goesOn;
}

/// Whether the overview of this moment is there; it is fetched where that is worth it. While others
/// keep writing, it is fetched again only after so many reads that they cost more, or after so long
/// a time that a listing does not notice.
bool StoreKeep::wantsOverview(std::uint64_t commits, bool listing) {
    if (m_overviewHeld && m_overviewCommits == commits) {
        return true;
    }
    m_overviewHeld = false;
    ++m_readsSince;
    if (!m_idsAsked && m_readsSince <= m_readsUntilNext &&
        !(listing && std::chrono::steady_clock::now() - m_overviewFetched > oldestListed)) {
        return false;
    }
    fetchOverview(commits);
    return true;
}

/// Null for a job that has none of the keys.
const StoreKeep::Row* StoreKeep::overviewRow(int id) {
    const auto isAt = [&](std::size_t row) {
        return row < m_overview.size() && m_overview[row].id == id;
    };
    if (!isAt(m_lastRow)) {
        ++m_lastRow;
    }
    if (!isAt(m_lastRow)) {
        const auto found = std::lower_bound(m_overview.begin(), m_overview.end(), id,
                                            [](const Row& row, int id) { return row.id < id; });
        m_lastRow = static_cast<std::size_t>(found - m_overview.begin());
    }
    return isAt(m_lastRow) ? &m_overview[m_lastRow] : nullptr;
}

void StoreKeep::fetchOverview(std::uint64_t commits) {
    m_overview.clear();
    m_engine->keysOfAll(jobType, jobOverview, largestOverviewBytes,
                        [&](int id, std::size_t name, SharedElements elements) {
                            if (m_overview.empty() || m_overview.back().id != id) {
                                m_overview.push_back({id, {}, {}});
                            }
                            auto& row = m_overview.back();
                            row.large[name] = elements == nullptr;
                            row.elements[name] = std::move(elements);
                        });
    m_lastRow = 0;
    m_overviewFetched = std::chrono::steady_clock::now();
    m_overviewCommits = commits;
    m_overviewHeld = true;
    m_idsAsked = false;
    m_readsSince = 0;
    m_readsUntilNext = 20 + m_overview.size();
}

std::shared_ptr<const TicketContent> StoreKeep::content(int type, int id, const KeyFilter& filter) {
    return orElse(std::shared_ptr<const TicketContent>(),
                  [&] { return m_engine->content(type, id, filter); });
}

bool StoreKeep::apply(int type, int id, SETMULTIPAR* table) {
    if (table == nullptr || table->key == nullptr) {
        return exists(type, id);
    }
    try {
        const bool done = orElse(false, [&] {
            return m_engine->change(type, id, scopeOf(table),
                                    [&](TicketContent& content) { content.apply(table); });
        });
        if (!done) {
            clearResults(table);
        }
        return done;
    } catch (...) {
        clearResults(table);
        throw;
    }
}

bool StoreKeep::transfer(int type, int id, const TicketContent& source, bool replace) {
    Scope scope;
    scope.everything = replace;
    for (const auto& [key, elements] : source.keys()) {
        scope.keys.emplace(key, false);
    }
    return orElse(false, [&] {
        return m_engine->change(type, id, scope,
                                [&](TicketContent& content) { content.transfer(source, replace); });
    });
}

} // namespace store
