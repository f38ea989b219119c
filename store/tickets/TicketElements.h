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

inline constexpr int highestPosition = 0xFFFFFF; ///< 16,777,215; higher positions are refused.

/// Values by position, with holes. Each element has its own type.
///
/// The count is the highest filled position plus one: the last position is never a hole.
class Elements {
  public:
    /// Numbers of one type, starting with PARAM_INT, at positions from 0 on. `bytes` is their
    /// memory image and must not be empty.
    static Elements ofNumbers(PARAM_TYPE type, std::string bytes);

    bool empty() const { return m_filled == 0; }
    /// At most highestPosition + 1.
    int count() const;
    /// The number of filled positions.
    int filled() const { return static_cast<int>(m_filled); }

    /// The type, if all elements are in the form of ofNumbers, otherwise PARAM_DELETE. Such
    /// elements are read directly from numbers(), without creating a Value for each.
    PARAM_TYPE numberType() const { return m_numberType; }
    const std::string& numbers() const { return m_numbers; }

    /// The same elements at the same positions, bit by bit.
    bool equals(const Elements& other) const;

    /// Null for a hole and after the end.
    const Value* at(int position) const;
    /// The element at the lowest filled position, or null.
    const Value* first() const;

    /// Sets the element at a position from 0 to highestPosition. Skipped positions become holes.
    void put(int position, Value value);

    /// Reserves room for `more` additional elements, if there are no holes.
    void reserve(int more) {
        const auto wanted = m_near.size() + static_cast<std::size_t>(more);
        if (m_near.size() == m_filled && wanted > m_near.capacity()) {
            m_near.reserve(std::max(wanted, 2 * m_near.capacity()));
        }
    }

    /// Removes the element or hole at the position. The following ones move up, and holes at the
    /// new end are removed. False after the end.
    bool remove(int position);

    /// Calls visit(position, value) for each element in ascending order until it returns false.
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
    /// Converts the numbers to values when values are needed.
    void unpack() const;

    // A single distant element must not cost memory for all holes before it, but an array filled in
    // any order must become an array. So elements are in m_near up to a size that depends on their
    // number, and in m_far beyond that.
    mutable std::vector<Value> m_near;
    std::map<int, Value> m_far;
    std::size_t m_filled = 0; ///< Elements in both, or numbers, without holes.

    // Empty if there are values.
    mutable std::string m_numbers;
    mutable PARAM_TYPE m_numberType = PARAM_DELETE;
};

/// Size of a number in bytes; 0 for a type that is not a number.
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

/// The object itself if nobody else uses it, otherwise a copy that replaces it.
template<class T>
T& own(std::shared_ptr<T>& shared) {
    if (!shared) {
        shared = std::make_shared<T>();
    } else if (shared.use_count() > 1) {
        shared = std::make_shared<T>(*shared);
    }
    return *shared;
}

/// Changes a key as one record of a table requires; a null pointer is a missing key.
///
/// A set at position -1 replaces the key by one element; -2 appends. Deleting at -1 always
/// succeeds, deleting an element only up to the end; deleting the last one removes the key. For
/// invalid values and other positions, returns false and changes nothing.
bool setElement(std::shared_ptr<Elements>& key, PARAM_TYPE type, const void* value, int position);

/// Reads from a key; null is a missing key.
///
/// A value is found only with its own type. Position -1 means the first element. PARAM_DELETE reads
/// the type, to a place that may be null; PARAM_COUNT, only at position -1, reads the count. If
/// there is nothing, or no place for a value, returns false and leaves the place unchanged.
bool readElement(const Elements* key, PARAM_TYPE type, void* out, int position,
                 HandedOut& handedOut);

} // namespace store
