// SPDX-License-Identifier: Apache-2.0
// The records that carry parameters across the plug-in boundary. Their values, sizes and offsets
// are a contract with plug-ins that were built without these headers (C95).
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>

/// Type of a value. Each comment describes what the record's value pointer refers to. When reading,
/// it is the place that receives the value.
enum PARAM_TYPE : std::int32_t {
    PARAM_DELETE = 0,  ///< Setting: null, deletes. Reading: tests whether the key exists; a
                       ///< PARAM_TYPE place, or null, receives the stored type.
    PARAM_POINTER = 1, ///< The void* itself, never what it points to.
    PARAM_INT = 2,     ///< int. Booleans are passed as 0 and 1 of this type.
    PARAM_DOUBLE = 3,  ///< double
    PARAM_STRING = 4,  ///< Setting: the zero-terminated text itself. Reading: a const char*
                       ///< place.
    PARAM_BINARY = 5,  ///< BIN_STRING
    PARAM_COUNT = 6,   ///< Reading at POSITION_WHOLE: an unsigned long place receives the number of
                       ///< elements. Never set.
    PARAM_INT64 = 7,   ///< long long
    PARAM_UINT = 8,    ///< unsigned int
    PARAM_UINT64 = 9,  ///< unsigned long long
};

/// Positions from 0 up are elements of a key.
inline constexpr int POSITION_APPEND = -2; ///< After the last element.
inline constexpr int POSITION_WHOLE =
    -1; ///< The key as a whole: set replaces it, delete removes it.

/// One record of a table to write. A null key ends the table. Keys and values belong to whoever
/// created the table.
struct SETMULTIPAR {
    const char* key = nullptr;
    PARAM_TYPE type = PARAM_DELETE;
    std::int32_t reserved1 = 0;
    const void* value = nullptr;
    std::int32_t position = 0;
    std::uint8_t result = 0; ///< Only bit 0 counts: the plug-in carried the record out.
    std::uint8_t reserved2[3] = {};

    bool ok() const { return (result & 1) != 0; }
};

/// One record of a table to read, laid out like SETMULTIPAR.
struct GETMULTIPAR {
    const char* key = nullptr;
    PARAM_TYPE type = PARAM_DELETE;
    std::int32_t reserved1 = 0;
    void* value = nullptr; ///< The place that receives the value.
    std::int32_t position = 0;
    std::uint8_t result = 0; ///< Only bit 0 counts: the place was filled.
    std::uint8_t reserved2[3] = {};

    bool ok() const { return (result & 1) != 0; }
};

/// A non-owning view of counted bytes.
struct BIN_STRING {
    const char* data = nullptr;
    std::size_t length = 0;

    BIN_STRING() = default;
    BIN_STRING(const std::string& bytes) : data(bytes.data()), length(bytes.size()) {}

    bool valid() const { return data != nullptr && length != 0; }
    const char* begin() const { return data; }
    const char* end() const { return data + length; }
};

/// Orders records by key only. A record without a key comes last, like the end of a table.
inline bool operator<(const SETMULTIPAR& a, const SETMULTIPAR& b) {
    if (a.key == nullptr || b.key == nullptr) {
        return a.key != nullptr;
    }
    return std::strcmp(a.key, b.key) < 0;
}

/// The parameter type that corresponds to a native type. Other types don't compile.
template<class T>
constexpr PARAM_TYPE GetParamType() = delete;
template<>
constexpr PARAM_TYPE GetParamType<void*>() {
    return PARAM_POINTER;
}
template<>
constexpr PARAM_TYPE GetParamType<int>() {
    return PARAM_INT;
}
template<>
constexpr PARAM_TYPE GetParamType<double>() {
    return PARAM_DOUBLE;
}
template<>
constexpr PARAM_TYPE GetParamType<const char*>() {
    return PARAM_STRING;
}
template<>
constexpr PARAM_TYPE GetParamType<long long>() {
    return PARAM_INT64;
}
template<>
constexpr PARAM_TYPE GetParamType<unsigned int>() {
    return PARAM_UINT;
}
template<>
constexpr PARAM_TYPE GetParamType<unsigned long long>() {
    return PARAM_UINT64;
}

static_assert(sizeof(PARAM_TYPE) == 4);
static_assert(sizeof(SETMULTIPAR) == 32 && sizeof(GETMULTIPAR) == 32);
static_assert(offsetof(SETMULTIPAR, key) == 0 && offsetof(GETMULTIPAR, key) == 0);
static_assert(offsetof(SETMULTIPAR, type) == 8 && offsetof(GETMULTIPAR, type) == 8);
static_assert(offsetof(SETMULTIPAR, reserved1) == 12 && offsetof(GETMULTIPAR, reserved1) == 12);
static_assert(offsetof(SETMULTIPAR, value) == 16 && offsetof(GETMULTIPAR, value) == 16);
static_assert(offsetof(SETMULTIPAR, position) == 24 && offsetof(GETMULTIPAR, position) == 24);
static_assert(offsetof(SETMULTIPAR, result) == 28 && offsetof(GETMULTIPAR, result) == 28);
static_assert(offsetof(SETMULTIPAR, reserved2) == 29 && offsetof(GETMULTIPAR, reserved2) == 29);
static_assert(sizeof(BIN_STRING) == 16);
static_assert(offsetof(BIN_STRING, data) == 0 && offsetof(BIN_STRING, length) == 8);
static_assert(sizeof(int) == 4 && sizeof(long long) == 8 && sizeof(unsigned long) == 8);
