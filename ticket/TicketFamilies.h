// SPDX-License-Identifier: Apache-2.0
// Reads and writes typed values, vectors and arrays, for both ways to reach a ticket.
//
// A vector of any length costs two plug-in calls: its count and one table. `Place` is
// ticket::Single or ticket::Contained. Pointers that are read belong to the ticket.
#pragma once

#include <concepts>
#include <cstddef>
#include <string>
#include <vector>

#include "base/Malloc.h"
#include "ticket/ParameterTables.h"
#include "ticket/TicketAccess.h"
#include "ticket/TicketFilenames.h"

namespace ticket {

/// Types that are passed by address.
template<class T>
concept Number =
    std::same_as<T, int> || std::same_as<T, unsigned int> || std::same_as<T, long long> ||
    std::same_as<T, unsigned long long> || std::same_as<T, double>;

/// Types that are pointers themselves.
template<class T>
concept Pointer = std::same_as<T, void*> || std::same_as<T, const char*>;

template<class T>
concept Element = Number<T> || Pointer<T>;

/// The text at a position, or null if there is none.
template<class Place>
const char* readText(const Place& place, const char* key, int position) {
    const char* text = nullptr;
    return place.get(key, PARAM_STRING, &text, position) ? text : nullptr;
}

/// If there is no text, returns false and empties `out`.
template<class Place>
bool readString(const Place& place, const char* key, std::string& out, int position) {
    const char* text = readText(place, key, position);
    out = text != nullptr ? text : "";
    return text != nullptr;
}

/// The text of the whole key, or the fallback.
template<class Place>
std::string readString(const Place& place, const char* key, const std::string& fallback) {
    const char* text = readText(place, key, POSITION_WHOLE);
    return text != nullptr ? text : fallback;
}

/// Same as readString, with forward slashes.
template<class Place>
bool readFilename(const Place& place, const char* key, std::string& out, int position) {
    const bool found = readString(place, key, out, position);
    out = FilenameFromTicket_C(out);
    return found;
}

/// The integer at a position, or the fallback.
template<class Place>
int readInt(const Place& place, const char* key, int fallback, int position) {
    int value = fallback;
    return place.get(key, PARAM_INT, &value, position) ? value : fallback;
}

/// True if the vector is not empty. A key without elements leaves the vector unchanged. Unreadable
/// elements are left out (C127), so after a hole, indexes no longer match positions.
template<class Place, Element T>
bool readVector(const Place& place, const char* key, std::vector<T>& out) {
    unsigned long count = 0;
    if (!place.get(key, PARAM_COUNT, &count, POSITION_WHOLE) || count == 0) {
        return false;
    }
    const base::Malloced<GETMULTIPAR[]> table(NewGetMultipar(count, key, GetParamType<T>()));
    if (!table) {
        return false;
    }
    out.resize(count);
    for (unsigned long i = 0; i < count; ++i) {
        table[i].value = &out[i];
    }
    place.get(table.get());
    unsigned long filled = 0;
    for (unsigned long i = 0; i < count; ++i) {
        if (table[i].ok()) {
            out[filled++] = out[i];
        }
    }
    out.resize(filled);
    return !out.empty();
}

/// Booleans from integers: true if not 0. Leaves the vector unchanged on failure.
template<class Place>
bool readVector(const Place& place, const char* key, std::vector<bool>& out) {
    std::vector<int> values;
    if (!readVector(place, key, values)) {
        return false;
    }
    out.resize(values.size());
    for (std::size_t i = 0; i < values.size(); ++i) {
        out[i] = values[i] != 0;
    }
    return true;
}

/// Leaves the vector unchanged if no element can be read.
template<class Place>
bool readVector(const Place& place, const char* key, std::vector<std::string>& out) {
    std::vector<const char*> texts;
    if (!readVector(place, key, texts)) {
        return false;
    }
    std::erase(texts, nullptr);
    out.assign(texts.begin(), texts.end());
    return !out.empty();
}

/// File names, with forward slashes. Empties `out` on failure.
template<class Place>
bool readFilenames(const Place& place, const char* key, std::vector<std::string>& out) {
    out.clear();
    std::vector<std::string> names;
    if (!readVector(place, key, names)) {
        return false;
    }
    out.reserve(names.size());
    for (const std::string& name : names) {
        out.push_back(FilenameFromTicket_C(name));
    }
    return true;
}

/// True if every element was read. Elements that could not be read keep their values.
template<class Place, Element T>
bool readArray(const Place& place, const char* key, T* out, unsigned long count) {
    if (count == 0) {
        return false;
    }
    const base::Malloced<GETMULTIPAR[]> table(NewGetMultipar(count, key, GetParamType<T>()));
    if (!table) {
        return false;
    }
    for (unsigned long i = 0; i < count; ++i) {
        table[i].value = &out[i];
    }
    place.get(table.get());
    return AllMultiParameterOk(table.get());
}

/// Reads all elements or changes none.
template<class Place>
bool readArray(const Place& place, const char* key, bool* out, unsigned long count) {
    if (count == 0) {
        return false;
    }
    const base::Malloced<int[]> values(static_cast<int*>(std::calloc(count, sizeof(int))));
    if (!values || !readArray(place, key, values.get(), count)) {
        return false;
    }
    for (unsigned long i = 0; i < count; ++i) {
        out[i] = values[i] != 0;
    }
    return true;
}

/// Replaces the key. True if every element was accepted. Without elements, deletes the key and
/// always returns true.
template<class Place, Element T>
bool writeElements(const Place& place, const char* key, const T* values, unsigned long count) {
    if (count == 0) {
        place.set(key, PARAM_DELETE, nullptr, POSITION_WHOLE);
        return true;
    }
    const base::Malloced<SETMULTIPAR[]> table(NewSetMultipar(count, key, GetParamType<T>()));
    if (!table) {
        return false;
    }
    for (unsigned long i = 0; i < count; ++i) {
        if constexpr (Pointer<T>) {
            table[i].value = values[i];
        } else {
            table[i].value = &values[i];
        }
    }
    place.set(table.get());
    return AllMultiParameterOk(table.get());
}

template<class Place, Element T>
bool writeVector(const Place& place, const char* key, const std::vector<T>& values) {
    return writeElements(place, key, values.data(), values.size());
}

template<class Place>
bool writeVector(const Place& place, const char* key, const std::vector<bool>& values) {
    return writeVector(place, key, std::vector<int>(values.begin(), values.end()));
}

template<class Place>
bool writeVector(const Place& place, const char* key, const std::vector<std::string>& values) {
    std::vector<const char*> texts;
    texts.reserve(values.size());
    for (const std::string& text : values) {
        texts.push_back(text.c_str());
    }
    return writeVector(place, key, texts);
}

template<class Place>
bool writeFilenames(const Place& place, const char* key, const std::vector<std::string>& names) {
    std::vector<std::string> slashed;
    FilenamesToTicket(slashed, names);
    return writeVector(place, key, slashed);
}

template<class Place, Element T>
bool writeArray(const Place& place, const char* key, const T* values, unsigned long count) {
    return writeElements(place, key, values, count);
}

/// Without elements, leaves the key unchanged (C126). Every other form deletes it.
template<class Place>
bool writeArray(const Place& place, const char* key, const bool* values, unsigned long count) {
    if (count == 0) {
        return true;
    }
    const base::Malloced<int[]> numbers(static_cast<int*>(std::calloc(count, sizeof(int))));
    if (!numbers) {
        return false;
    }
    // Only bit 0 of a foreign bool is defined, so this reads bytes.
    const auto* bytes = reinterpret_cast<const unsigned char*>(values);
    for (unsigned long i = 0; i < count; ++i) {
        numbers[i] = bytes[i] & 1;
    }
    return writeElements(place, key, numbers.get(), count);
}

} // namespace ticket

// The same functions for callers that have a record instead of a view: x for values passed by
// address, xp for pointers. Results are as described above.

template<ticket::Element T>
bool xGetVectorParameter(const STICKET_ACCESS& access, const char* key, std::vector<T>& out) {
    return ticket::readVector(ticket::Single(access), key, out);
}

template<ticket::Element T>
bool xGetVectorParameter(const MTICKET_ACCESS& access, int type, int id, const char* key,
                         std::vector<T>& out) {
    return ticket::readVector(ticket::Contained(access, type, id), key, out);
}

template<ticket::Element T>
bool xGetArrayParameter(const STICKET_ACCESS& access, const char* key, T* out,
                        unsigned long count) {
    return ticket::readArray(ticket::Single(access), key, out, count);
}

template<ticket::Element T>
bool xGetArrayParameter(const MTICKET_ACCESS& access, int type, int id, const char* key, T* out,
                        unsigned long count) {
    return ticket::readArray(ticket::Contained(access, type, id), key, out, count);
}

template<ticket::Number T>
bool xSetVectorParameter(const STICKET_ACCESS& access, const char* key,
                         const std::vector<T>& values) {
    return ticket::writeVector(ticket::Single(access), key, values);
}

template<ticket::Number T>
bool xSetVectorParameter(const MTICKET_ACCESS& access, int type, int id, const char* key,
                         const std::vector<T>& values) {
    return ticket::writeVector(ticket::Contained(access, type, id), key, values);
}

template<ticket::Pointer T>
bool xpSetVectorParameter(const STICKET_ACCESS& access, const char* key,
                          const std::vector<T>& values) {
    return ticket::writeVector(ticket::Single(access), key, values);
}

template<ticket::Pointer T>
bool xpSetVectorParameter(const MTICKET_ACCESS& access, int type, int id, const char* key,
                          const std::vector<T>& values) {
    return ticket::writeVector(ticket::Contained(access, type, id), key, values);
}

template<ticket::Number T>
bool xSetArrayParameter(const STICKET_ACCESS& access, const char* key, const T* values,
                        unsigned long count) {
    return ticket::writeArray(ticket::Single(access), key, values, count);
}

template<ticket::Number T>
bool xSetArrayParameter(const MTICKET_ACCESS& access, int type, int id, const char* key,
                        const T* values, unsigned long count) {
    return ticket::writeArray(ticket::Contained(access, type, id), key, values, count);
}

template<ticket::Pointer T>
bool xpSetArrayParameter(const STICKET_ACCESS& access, const char* key, const T* values,
                         unsigned long count) {
    return ticket::writeArray(ticket::Single(access), key, values, count);
}

template<ticket::Pointer T>
bool xpSetArrayParameter(const MTICKET_ACCESS& access, int type, int id, const char* key,
                         const T* values, unsigned long count) {
    return ticket::writeArray(ticket::Contained(access, type, id), key, values, count);
}
