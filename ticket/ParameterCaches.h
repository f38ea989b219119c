// SPDX-License-Identifier: Apache-2.0
// Sets of values whose elements keep their addresses until the set is cleared. A table of pointers
// can therefore outlive the caller's variables, and equal values are stored once.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <deque>
#include <functional>
#include <set>
#include <string>
#include <vector>

#include "ticket/ParameterRecords.h"

/// Owns counted bytes and a view of them.
class BIN_STRING_BUFFER {
  public:
    /// An invalid view gives an empty buffer with an empty view.
    explicit BIN_STRING_BUFFER(const BIN_STRING& bytes);
    BIN_STRING_BUFFER(const BIN_STRING_BUFFER& other);
    BIN_STRING_BUFFER& operator=(const BIN_STRING_BUFFER& other);
    ~BIN_STRING_BUFFER() = default;

    const BIN_STRING* BinString() const { return &m_view; }

    bool operator<(const BIN_STRING_BUFFER& other) const { return m_bytes < other.m_bytes; }

  private:
    std::string m_bytes;
    BIN_STRING m_view; ///< Of m_bytes.
};

/// Texts.
class STRINGCACHE {
  public:
    STRINGCACHE() = default;
    STRINGCACHE(const STRINGCACHE&) = delete;
    STRINGCACHE& operator=(const STRINGCACHE&) = delete;

    /// Stores a copy of the text, points the pointer to it and returns it. Null stays null.
    const char* operator()(const char*& text);
    /// Same, with the pointer passed by value.
    const char* operator[](const char* text);

    /// True if the text is stored. Always false for null.
    bool find(const char* text) const;
    void clear() {
        m_texts.clear();
        m_last = nullptr;
    }

  private:
    std::set<std::string, std::less<>> m_texts;
    const std::string* m_last = nullptr; ///< The latest lookup: equal keys come in runs.
};

/// Numbers. The caller must keep NaNs out, since a NaN equals nothing. 0.0 and -0.0 are equal: the
/// first one added is stored. This is a hash table because arrays of distinct measured values pass
/// through it, and a tree would take most of the time needed to write them.
template<class T>
class VALCACHE {
  public:
    VALCACHE() = default;
    VALCACHE(const VALCACHE&) = delete;
    VALCACHE& operator=(const VALCACHE&) = delete;

    /// Stores a copy of the value, points the pointer to it and returns it. Null stays null.
    const T* operator()(const T*& value) {
        if (value != nullptr) {
            value = &Stored(*value);
        }
        return value;
    }
    void clear() {
        m_values.clear();
        m_places.clear();
    }
    /// Makes room for `more` additional values.
    void reserve(std::size_t more) {
        const std::size_t places = std::bit_ceil(2 * (m_values.size() + more) + 1);
        if (more != 0 && places > m_places.size()) {
            Grow(places);
        }
    }

  private:
    const T& Stored(const T& value) {
        if (2 * m_values.size() >= m_places.size()) {
            Grow(m_places.empty() ? 16 : 4 * m_places.size());
        }
        const T*& place = PlaceOf(value);
        if (place == nullptr) {
            place = &m_values.emplace_back(value);
        }
        return *place;
    }

    /// The place of the value, or the free place where it belongs. There is always a free place.
    const T*& PlaceOf(const T& value) {
        // Equal values have equal bits, except the zeros of a double.
        std::uint64_t bits = 0;
        if (value != T(0)) {
            std::memcpy(&bits, &value, sizeof value);
        }
        const std::size_t last = m_places.size() - 1; // The size is a power of two.
        // The highest bits of the product depend on all bits of the value.
        std::size_t place = bits * 0x9E3779B97F4A7C15 >> std::countl_zero(last);
        while (m_places[place] != nullptr && *m_places[place] != value) {
            place = (place + 1) & last;
        }
        return m_places[place];
    }

    void Grow(std::size_t places) {
        m_places.assign(places, nullptr);
        for (const T& value : m_values) {
            PlaceOf(value) = &value;
        }
    }

    std::deque<T> m_values;         ///< In order of insertion.
    std::vector<const T*> m_places; ///< Hash table of m_values, at most half full.
};

/// Binary values.
class BIN_STRING_CACHE {
  public:
    /// Stores a copy of the bytes, redirects the pointer to the copy's view and returns it. Null
    /// stays null.
    const BIN_STRING* operator()(const BIN_STRING*& bytes);
    void clear() { m_buffers.clear(); }

  private:
    std::set<BIN_STRING_BUFFER> m_buffers;
};
