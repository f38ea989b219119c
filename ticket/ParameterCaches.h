// SPDX-License-Identifier: Apache-2.0
// Sets of values whose stored elements keep their addresses until the set is cleared. They let a
// table of pointers outlive the variables of those who filled it, and store what is equal once.
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

/// Counted bytes of its own, with a view on them.
class BIN_STRING_BUFFER {
  public:
    /// A view that is not valid gives an empty buffer with an empty view.
    explicit BIN_STRING_BUFFER(const BIN_STRING& bytes);
    BIN_STRING_BUFFER(const BIN_STRING_BUFFER& other);
    BIN_STRING_BUFFER& operator=(const BIN_STRING_BUFFER& other);
    ~BIN_STRING_BUFFER() = default;

    const BIN_STRING* BinString() const { return &m_view; }

    bool operator<(const BIN_STRING_BUFFER& other) const { return m_bytes < other.m_bytes; }

  private:
    std::string m_bytes;
    BIN_STRING m_view; ///< On m_bytes.
};

/// Texts.
class STRINGCACHE {
  public:
    STRINGCACHE() = default;
    STRINGCACHE(const STRINGCACHE&) = delete;
    STRINGCACHE& operator=(const STRINGCACHE&) = delete;

    /// Stores a copy of the text, redirects the pointer to it and gives it back. Null stays null.
    const char* operator()(const char*& text);
    /// The same by value.
    const char* operator[](const char* text);

    /// True if the text is stored; null never is.
    bool find(const char* text) const;
    void clear() {
        m_texts.clear();
        m_last = nullptr;
    }

  private:
    std::set<std::string, std::less<>> m_texts;
    const std::string* m_last = nullptr; ///< The one asked for last: keys come in runs.
};

/// Numbers. Of a double no NaN may come here, since it equals nothing; 0.0 and -0.0 are the same,
/// and the first to come is stored. A hash table: arrays of measured values, no two of which are
/// alike, go through here, and with a tree that would be most of the time that writing them takes.
template<class T>
class VALCACHE {
  public:
    VALCACHE() = default;
    VALCACHE(const VALCACHE&) = delete;
    VALCACHE& operator=(const VALCACHE&) = delete;

    /// Stores a copy of the value, redirects the pointer to it and gives it back. Null stays null.
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
    /// Makes room for that many more values.
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

    /// Where the value is, or where it is to go: there is always a free place.
    const T*& PlaceOf(const T& value) {
        // Equal values have equal bits but for the zeros of a double.
        std::uint64_t bits = 0;
        if (value != T(0)) {
            std::memcpy(&bits, &value, sizeof value);
        }
        const std::size_t last = m_places.size() - 1; // The size is a power of two.
        // The highest bits of the product are those that all bits of the value have a part in.
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

    std::deque<T> m_values;         ///< In order of arrival.
    std::vector<const T*> m_places; ///< Of the values, by their bits: at most half are taken.
};

/// Binary values.
class BIN_STRING_CACHE {
  public:
    /// Stores a copy of the bytes, redirects the pointer to the copy's view and gives it back. Null
    /// stays null.
    const BIN_STRING* operator()(const BIN_STRING*& bytes);
    void clear() { m_buffers.clear(); }

  private:
    std::set<BIN_STRING_BUFFER> m_buffers;
};
