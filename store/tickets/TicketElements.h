// SPDX-License-Identifier: Apache-2.0
// The elements of one key.
#pragma once

#include <algorithm>
#include <cstddef>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "store/tickets/TicketValue.h"

namespace store {

inline constexpr int highestPosition = 0xFFFFFF; ///< 16,777,215; positions beyond are refused.

/// Values by position, with holes. Each element has a type of its own.
///
/// The count is the highest filled position plus one: the last position is never a hole.
class Elements {
  public:
    /// Numbers of one type, from PARAM_INT on, in positions from 0 on; bytes holds them as they lie
    /// in memory, and not none of them.
    static Elements ofNumbers(PARAM_TYPE type, std::string bytes);

    bool empty() const { return m_filled == 0; }
    /// At most highestPosition + 1.
    int count() const;
    /// How many positions are filled.
    int filled() const { return static_cast<int>(m_filled); }

    /// Where all of it is what ofNumbers made, its type, else PARAM_DELETE. Such elements are read
    /// from numbers() alone, which spares making a Value of each.
    PARAM_TYPE numberType() const { return m_numberType; }
    const std::string& numbers() const { return m_numbers; }

    /// The same elements in the same places, bit by bit.
    bool equals(const Elements& other) const;

    /// Null for a hole and beyond the end.
    const Value* at(int position) const;
    /// The element of the lowest position; null when there is none.
    const Value* first() const;

    /// Sets the element at a position from 0 to highestPosition. Positions that are passed over
    /// become holes.
    void put(int position, Value value);

    /// Makes room for that many more elements, where there are no holes so far.
    void reserve(int more) {
        const auto wanted = m_near.size() + static_cast<std::size_t>(more);
        if (m_near.size() == m_filled && wanted > m_near.capacity()) {
            m_near.reserve(std::max(wanted, 2 * m_near.capacity()));
        }
    }

    /// Takes out what stands at the position, be it a hole; what stands behind it moves up, and
    /// holes that then end the key go. False beyond the end.
    bool remove(int position);

    /// Calls visit(position, value) for each element in ascending order as long as it gives true.
    template<class Visit>
    void visit(Visit visit) const {
        unpack();
        for (std::size_t i = 0; i < m_near.size(); ++i) {
            if (typeOf(m_near[i]) != PARAM_DELETE && !visit(static_cast<int>(i), m_near[i])) {
                return;
            }
        }
        for (const auto& [position, value] : m_far) {
            if (!visit(position, value)) {
                return;
            }
        }
    }

  private:
    std::size_t nearLimit() const;
    void settle();
    /// Makes values of the numbers, for those who want values.
    void unpack() const;

    // A lone element far out must not cost the memory of all the holes in front of it, whereas an
    // array that is filled in any order is to end up as an array. So elements stand in m_near up to
    // a size that follows from their number, and what lies beyond in m_far.
    mutable std::vector<Value> m_near;
    std::map<int, Value> m_far;
    std::size_t m_filled = 0; ///< Elements in both, or numbers; holes not counted.

    // Empty as soon as there are values.
    mutable std::string m_numbers;
    mutable PARAM_TYPE m_numberType = PARAM_DELETE;
};

/// Bytes that a number takes; 0 for a type that is none.
constexpr std::size_t numberSize(PARAM_TYPE type) {
    switch (type) {
    case PARAM_INT:
    case PARAM_UINT:
        return 4;
    case PARAM_DOUBLE:
    case PARAM_INT64:
    case PARAM_UINT64:
        return 8;
    default:
        return 0;
    }
}

/// The object itself where nobody else holds it, else a copy that takes its place.
template<class T>
T& own(std::shared_ptr<T>& shared) {
    if (!shared) {
        shared = std::make_shared<T>();
    } else if (shared.use_count() > 1) {
        shared = std::make_shared<T>(*shared);
    }
    return *shared;
}

/// Changes a key as one record of a table asks; a null pointer is a key that isn't there.
///
/// Position -1 set replaces the key by one element, -2 appends. Deleting with -1 succeeds in any
/// case, an element only if it does not lie beyond the end, and with the last element the key goes.
/// False, and the key is untouched, for a value that can't be kept and for any other position.
bool setElement(std::shared_ptr<Elements>& key, PARAM_TYPE type, const void* value, int position);

/// Reads from a key; null is a key that isn't there.
///
/// A value is found only under its own type; position -1 means the first element. PARAM_DELETE asks
/// for the type, to a place that may be null, and PARAM_COUNT, at position -1 only, for the count.
/// False, and the place is untouched, when there is nothing or no place for a value.
bool readElement(const Elements* key, PARAM_TYPE type, void* out, int position,
                 HandedOut& handedOut);

} // namespace store
