// SPDX-License-Identifier: Apache-2.0
#include "store/CachingStorage.h"

#include <algorithm>
#include <limits>
#include <utility>

namespace store {

namespace {

// Positions in a listing: before the first key, and outside any listing.
constexpr std::pair listingStarts = {-1, std::size_t{0}};
constexpr std::pair notListing = {std::numeric_limits<int>::max(), std::size_t{0}};

template<class Body, class Result>
Result orElse(Result otherwise, Body body) {
    try {
        return body();
    } catch (const StoreFailure&) {
        return otherwise;
    }
}

/// Whether a record, as the first one of its key, replaces everything that the key had.
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
    scope.repeatable = true;
    const char* last = nullptr;
    bool needed = false; // Whether the old value of the record's key is needed.
    for (const auto* record = table; record->key != nullptr; ++record) {
        if (record->key != last) {
            last = record->key;
            needed = scope.keys.try_emplace(last, !replacesKey(*record)).first->second;
        }
        const bool counts = record->position == POSITION_APPEND ||
                            (record->type == PARAM_DELETE && record->position != POSITION_WHOLE);
        scope.repeatable = scope.repeatable && !(needed && counts);
    }
    return scope;
}

std::vector<std::string> keysIn(const SETMULTIPAR* table) {
    std::vector<std::string> keys;
    for (; table->key != nullptr; ++table) {
        if (keys.empty() || keys.back() != table->key) {
            keys.emplace_back(table->key);
        }
    }
    return keys;
}

} // namespace

CachingStorage::CachingStorage(std::shared_ptr<StoreEngine> engine, NoteFailure note)
    : m_engine(std::move(engine)), m_note(std::move(note)) {}

/// Writes to a ticket, unless an earlier write to it was lost. If the store fails, notes each key
/// and returns false.
template<class Keys, class Write>
bool CachingStorage::write(int type, int id, Keys keys, Write write) {
    const std::pair address = {type, id};
    std::string reason = "an earlier write to this ticket was lost";
    if (!m_cutOff.contains(address)) {
        // Before the write, so that no memory is needed after it.
        const auto cutOff = m_cutOff.insert(address).first;
        try {
            const bool written = write();
            m_cutOff.erase(cutOff);
            if (written) {
                return true;
            }
            reason = "there is no such ticket";
        } catch (const StoreFailure& failure) {
            reason = failure.what();
        }
    }
    if (m_note) {
        for (const std::string& key : keys()) {
            m_note(type, id, key, reason);
        }
    }
    return false;
}

std::vector<int> CachingStorage::ids(int type) {
    return orElse(std::vector<int>(), [&] { return listIds(type); });
}

std::vector<int> CachingStorage::listIds(int type) {
    if (type != jobType) {
        return m_engine->ids(type);
    }
    m_listed = listingStarts;
    const std::uint64_t commits = m_engine->commits(std::chrono::milliseconds(0));
    if (!m_overviewHeld || m_overviewCommits != commits) {
        fetchOverview(commits);
    }
    return m_overview.ids();
}

bool CachingStorage::exists(int type, int id) {
    return orElse(false, [&] { return m_engine->exists(type, id); });
}

bool CachingStorage::create(int type, int id) {
    return orElse(false, [&] { return m_engine->create(type, id); });
}

int CachingStorage::createNext(int type) {
    return orElse(-1, [&] { return m_engine->createNext(type); });
}

bool CachingStorage::remove(int type, int id) {
    const auto none = [] { return std::vector<std::string>(); };
    return write(type, id, none, [&] { return m_engine->remove(type, id); });
}

std::shared_ptr<const Elements> CachingStorage::key(int type, int id, std::string_view key) {
    return orElse(SharedElements(), [&] {
        const std::size_t index = type == jobType ? overviewKey(key) : overviewKeys.size();
        const bool inOverview = index != overviewKeys.size();
        const bool again = id == m_fetched.id && type == m_fetched.type && key == m_fetched.key;
        const bool listing = inOverview && goesOn(id, index);
        // Read before the store: commits in between only cause the next read to fetch again.
        const std::uint64_t commits =
            m_engine->commits(listing ? oldestListed : std::chrono::milliseconds(0));
        if (again && commits == m_fetched.commits) {
            return m_fetched.elements;
        }
        if (inOverview && wantsOverview(commits, listing)) {
            int number = 0;
            switch (m_overview.find(id, index, number)) {
            case JobOverview::Holds::Nothing:
                return SharedElements();
            case JobOverview::Holds::Number:
                return elementsOf(index, number);
            case JobOverview::Holds::SomethingElse:
                break;
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

/// Whether a read of the overview continues a listing, i.e. is not its first.
bool CachingStorage::goesOn(int id, std::size_t overviewKey) {
    const std::pair next = {id, overviewKey};
    const bool starts = m_listed == listingStarts;
    const bool goesOn = !starts && m_listed < next;
    m_listed = starts || goesOn ? next : notListing;
    return goesOn;
}

/// Whether the overview is current; fetches it if that is worthwhile. If others keep writing, it is
/// fetched again only after so many reads that they cost more, or after a time that a listing does
/// not notice.
bool CachingStorage::wantsOverview(std::uint64_t commits, bool listing) {
    if (m_overviewHeld && m_overviewCommits == commits) {
        return true;
    }
    m_overviewHeld = false;
    ++m_readsSince;
    if (m_readsSince <= m_readsUntilNext &&
        !(listing && std::chrono::steady_clock::now() - m_overviewFetched > oldestListed)) {
        return false;
    }
    fetchOverview(commits);
    return true;
}

void CachingStorage::fetchOverview(std::uint64_t commits) {
    m_overviewHeld = false;
    m_engine->overview(m_overview);
    m_overviewFetched = std::chrono::steady_clock::now();
    m_overviewCommits = commits;
    m_overviewHeld = true;
    m_readsSince = 0;
    m_readsUntilNext = 20 + m_overview.ids().size();
}

const CachingStorage::SharedElements& CachingStorage::elementsOf(std::size_t key, int number) {
    auto& [last, elements] = m_lastNumbers[key];
    if (elements == nullptr || last != number) {
        auto& known = m_numbers[number];
        if (known == nullptr) {
            Elements made;
            made.put(0, number);
            known = std::make_shared<const Elements>(std::move(made));
        }
        last = number;
        elements = known;
    }
    return elements;
}

std::shared_ptr<const TicketContent> CachingStorage::content(int type, int id,
                                                             const KeyFilter& filter) {
    return orElse(std::shared_ptr<const TicketContent>(),
                  [&] { return m_engine->content(type, id, filter); });
}

bool CachingStorage::apply(int type, int id, SETMULTIPAR* table) {
    if (table == nullptr || table->key == nullptr) {
        return exists(type, id);
    }
    try {
        const bool done = write(
            type, id, [&] { return keysIn(table); },
            [&] {
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

bool CachingStorage::transfer(int type, int id, const TicketContent& source, bool replace) {
    Scope scope;
    scope.everything = replace;
    scope.repeatable = true;
    for (const auto& [key, elements] : source.keys()) {
        scope.keys.emplace(key, false);
    }
    const auto keys = [&] {
        std::vector<std::string> names;
        for (const auto& [key, elements] : source.keys()) {
            names.push_back(key);
        }
        return names;
    };
    return write(type, id, keys, [&] {
        return m_engine->change(type, id, scope,
                                [&](TicketContent& content) { content.transfer(source, replace); });
    });
}

} // namespace store
