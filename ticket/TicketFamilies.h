// SPDX-License-Identifier: Apache-2.0
// Reading and writing typed values, vectors and arrays, once for both ways to reach a ticket.
//
// A vector costs two calls of the plug-in, its count and one table, whatever its length. `Place` is
// ticket::Single or ticket::Contained. Pointers that are read belong to the ticket.
#pragma once

#include <concepts>
#include <cstddef>
#include <string>
#include <vector>

#include "ticket/ParameterTables.h"
#include "ticket/TicketAccess.h"
#include "ticket/TicketFilenames.h"

namespace ticket {

/// Types that travel by their address.
template<class T>
concept Number =
    std::same_as<T, int> || std::same_as<T, unsigned int> || std::same_as<T, long long> ||
    std::same_as<T, unsigned long long> || std::same_as<T, double>;

/// Types that are pointers themselves.
template<class T>
concept Pointer = std::same_as<T, void*> || std::same_as<T, const char*>;

template<class T>
concept Element = Number<T> || Pointer<T>;

/// The text at a position, or null where there is none.
template<class Place>
const char* readText(const Place& place, const char* key, int position) {
    const char* text = nullptr;
    return place.get(key, PARAM_STRING, &text, position) ? text : nullptr;
}

/// False, with `out` emptied, where there is no text.
template<class Place>
bool readString(const Place& place, const char* key, std::string& out, int position) {
    const char* text = readText(place, key, position);
    out = text != nullptr ? text : "";
    return text != nullptr;
}

/// The text of the key as a whole, or the fallback.
template<class Place>
std::string readString(const Place& place, const char* key, const std::string& fallback) {
    const char* text = readText(place, key, POSITION_WHOLE);
    return text != nullptr ? text : fallback;
}

/// As readString, with forward slashes.
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

/// True when the vector is not empty. It keeps its content where the key has no elements. Elements
/// that can't be read are left out (C127), so those after a hole don't carry their positions.
template<class Place, Element T>
bool readVector(const Place& place, const char* key, std::vector<T>& out) {
    unsigned long count = 0;
    if (!place.get(key, PARAM_COUNT, &count, POSITION_WHOLE) || count == 0) {
        return false;
    }
    const Block<GETMULTIPAR> table(NewGetMultipar(count, key, GetParamType<T>()));
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

/// Booleans from integers: true where not 0. On false the vector is as it was.
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

/// On a key without readable elements the vector is as it was.
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

/// File names, with forward slashes; empty on false.
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

/// True when every element was read; those that were not stay as they were.
template<class Place, Element T>
bool readArray(const Place& place, const char* key, T* out, unsigned long count) {
    if (count == 0) {
        return false;
    }
    const Block<GETMULTIPAR> table(NewGetMultipar(count, key, GetParamType<T>()));
    if (!table) {
        return false;
    }
    for (unsigned long i = 0; i < count; ++i) {
        table[i].value = &out[i];
    }
    place.get(table.get());
    return AllMultiParameterOk(table.get());
}

/// All of the array or nothing of it.
template<class Place>
bool readArray(const Place& place, const char* key, bool* out, unsigned long count) {
    if (count == 0) {
        return false;
    }
    const Block<int> values(static_cast<int*>(std::calloc(count, sizeof(int))));
    if (!values || !readArray(place, key, values.get(), count)) {
        return false;
    }
    for (unsigned long i = 0; i < count; ++i) {
        out[i] = values[i] != 0;
    }
    return true;
}

/// Replaces the key. True when every element was taken; without elements the key is deleted, and
/// the result is true whatever came of that.
template<class Place, Element T>
bool writeElements(const Place& place, const char* key, const T* values, unsigned long count) {
    if (count == 0) {
        place.set(key, PARAM_DELETE, nullptr, POSITION_WHOLE);
        return true;
    }
    const Block<SETMULTIPAR> table(NewSetMultipar(count, key, GetParamType<T>()));
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

/// Without elements the key is left alone (C126), where every other form deletes it.
template<class Place>
bool writeArray(const Place& place, const char* key, const bool* values, unsigned long count) {
    if (count == 0) {
        return true;
    }
    const Block<int> numbers(static_cast<int*>(std::calloc(count, sizeof(int))));
    if (!numbers) {
        return false;
    }
    // Of a bool from elsewhere bit 0 alone is sure, hence the bytes.
    const auto* bytes = reinterpret_cast<const unsigned char*>(values);
    for (unsigned long i = 0; i < count; ++i) {
        numbers[i] = bytes[i] & 1;
    }
    return writeElements(place, key, numbers.get(), count);
}

} // namespace ticket

// The same for callers that hold a record and no view: x for values that travel by their address,
// xp for pointers. Results as told above.

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
