// SPDX-License-Identifier: Apache-2.0
#include "store/postgres/PostgresListing.h"

#include <algorithm>
#include <array>
#include <climits>
#include <cstdint>
#include <cstring>
#include <memory>
#include <numeric>
#include <string_view>
#include <utility>

#include <endian.h>

#include "store/Engines.h"

namespace store::postgres {

namespace {

// The keys of a listing have few different values, so one row per name and value with all its
// tickets' numbers costs less than one row per key. The numbers are packed, because an array costs
// more. The tickets of the type are an additional row that starts with nulls: joining the two here
// costs a tenth of a join on the server. A single statement sees one moment. If most keys are
// skipped, comparing the name, at the start of a row, is faster than the hash after it.
constexpr Statement keysOfType = {
    "SELECT name, value, string_agg(int8send(ticket), ''), NULL FROM (SELECT name, ticket,"
    " CASE WHEN length(value) <= $3 THEN value END AS value"
    " FROM tintgate.keys WHERE name = ANY ($2::bytea[])) AS found GROUP BY name, value"
    " UNION ALL SELECT NULL, NULL,"
    " string_agg(int8send(number), ''), string_agg(int4send(id), '')"
    " FROM tintgate.tickets WHERE type = $1"};
enum Column { NameColumn, ValueColumn, NumbersColumn, IdsColumn };

/// Removes and returns the first of the packed numbers.
std::int64_t takeBigint(std::string_view& packed) {
    std::uint64_t bytes = 0;
    std::memcpy(&bytes, packed.data(), sizeof bytes);
    packed.remove_prefix(sizeof bytes);
    return static_cast<std::int64_t>(be64toh(bytes));
}
int takeInt(std::string_view& packed) {
    std::uint32_t bytes = 0;
    std::memcpy(&bytes, packed.data(), sizeof bytes);
    packed.remove_prefix(sizeof bytes);
    return static_cast<int>(be32toh(bytes));
}

/// Id and number.
using Ticket = std::pair<int, std::int64_t>;

/// Sorted by id.
std::vector<Ticket> ticketsIn(const Result& rows, int row) {
    std::string_view ids = rows.bytes(row, IdsColumn);
    std::string_view numbers = rows.bytes(row, NumbersColumn);
    std::vector<Ticket> tickets;
    if (ids.size() % sizeof(int) != 0 || ids.size() / sizeof(int) != numbers.size() / 8 ||
        numbers.size() % 8 != 0) {
        failDamaged();
    }
    while (!ids.empty()) {
        const int id = takeInt(ids);
        tickets.emplace_back(id, takeBigint(numbers));
    }
    std::sort(tickets.begin(), tickets.end());
    return tickets;
}

/// A key of some ticket.
struct Key {
    std::int64_t ticket; ///< Its ticket's number.
    std::size_t row;     ///< The row with its name and value.
};

/// A radix sort: the numbers of a store's tickets are so close together that few digits are enough.
void sortByTicket(std::vector<Key>& keys) {
    constexpr int digitBits = 11;
    constexpr int digits = 1 << digitBits;
    std::int64_t highest = 0;
    for (const Key& key : keys) {
        highest = std::max(highest, key.ticket);
    }
    std::vector<Key> sorted(keys.size());
    for (int shift = 0; shift < 63 && highest >> shift != 0; shift += digitBits) {
        const auto digit = [shift](const Key& key) {
            return static_cast<std::size_t>(key.ticket >> shift & (digits - 1));
        };
        std::array<std::size_t, digits + 1> starts{};
        for (const Key& key : keys) {
            ++starts[digit(key) + 1];
        }
        std::partial_sum(starts.begin(), starts.end(), starts.begin());
        for (const Key& key : keys) {
            sorted[starts[digit(key)]++] = key;
        }
        keys.swap(sorted);
    }
}

} // namespace

void askForKeys(Connection& connection, int type, const std::vector<std::string>& names,
                std::size_t largestBytes) {
    connection.send(keysOfType, type, std::vector<std::string_view>(names.begin(), names.end()),
                    static_cast<int>(std::min<std::size_t>(largestBytes, INT_MAX)));
}

void showKeys(const Result& rows, const std::vector<std::string>& names,
              const StoreEngine::ShowKey& show) {
    const auto rowCount = static_cast<std::size_t>(rows.rows());
    std::vector<std::size_t> nameOf(rowCount);
    std::vector<std::shared_ptr<const Elements>> elementsOf(rowCount);
    std::vector<Ticket> tickets;
    std::vector<Key> keys;
    for (std::size_t i = 0; i < rowCount; ++i) {
        const int row = static_cast<int>(i);
        if (rows.isNull(row, NameColumn)) {
            tickets = ticketsIn(rows, row);
            continue;
        }
        const auto name = std::find(names.begin(), names.end(), rows.bytes(row, NameColumn));
        if (name == names.end() || rows.bytes(row, NumbersColumn).size() % 8 != 0) {
            failDamaged();
        }
        nameOf[i] = static_cast<std::size_t>(name - names.begin());
        if (!rows.isNull(row, ValueColumn)) {
            elementsOf[i] = decoded(rows.bytes(row, ValueColumn));
        }
        for (std::string_view numbers = rows.bytes(row, NumbersColumn); !numbers.empty();) {
            keys.push_back({takeBigint(numbers), i});
            if (keys.back().ticket < 0) {
                failDamaged();
            }
        }
    }
    sortByTicket(keys);
    auto key = keys.begin();
    for (const auto& [id, number] : tickets) {
        if (key == keys.end() || key->ticket != number) { // Ids and numbers mostly rise together.
            key = std::lower_bound(
                keys.begin(), keys.end(), number,
                [](const Key& key, std::int64_t number) { return key.ticket < number; });
        }
        for (; key != keys.end() && key->ticket == number; ++key) {
            show(id, nameOf[key->row], elementsOf[key->row]);
        }
    }
}

} // namespace store::postgres
