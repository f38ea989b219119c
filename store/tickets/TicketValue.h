// SPDX-License-Identifier: Apache-2.0
// One value of a ticket, as stored by the plug-in.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <unordered_set>
#include <variant>

#include "ticket/ParameterRecords.h"

namespace store {

/// Immutable bytes, shared by tickets; readers keep pointers to them.
struct Bytes {
    explicit Bytes(std::string bytes) : text(std::move(bytes)), view(text) {}
    Bytes(const Bytes&) = delete;
    Bytes& operator=(const Bytes&) = delete;

    const std::string text;
    const BIN_STRING view; ///< Of `text`; data is not null, even if empty.
};
using SharedBytes = std::shared_ptr<const Bytes>;

/// A position of a key without a value.
struct Hole {};
/// Bytes without a zero byte.
struct Text {
    SharedBytes bytes;
};
struct Binary {
    SharedBytes bytes;
};
struct NeverKept {};

/// The alternatives are in the order of PARAM_TYPE, so index() is the type.
using Value = std::variant<Hole, void*, int, double, Text, Binary, NeverKept, long long,
                           unsigned int, unsigned long long>;

inline PARAM_TYPE typeOf(const Value& value) {
    return static_cast<PARAM_TYPE>(value.index());
}

/// The texts and binaries that readers use. Each lives as long as the object, and equal ones are
/// kept once, so memory grows only with the number of different values.
class HandedOut {
  public:
    const Bytes& keep(const SharedBytes& bytes);

  private:
    struct Content {
        std::size_t operator()(const SharedBytes& bytes) const;
        bool operator()(const SharedBytes& a, const SharedBytes& b) const;
    };

    std::unordered_set<SharedBytes, Content, Content> m_bytes;
};

/// Copies the value that a record of this type points to. Nothing if it can't be stored: a type
/// without values, an unknown type, a null value except for PARAM_POINTER, bytes without data.
std::optional<Value> takeValue(PARAM_TYPE type, const void* value);

/// The pointer that a walk shows for the value; valid as long as the value exists.
const void* valuePointer(const Value& value);

/// Writes the value to the place for a record of its type.
void giveValue(const Value& value, void* out, HandedOut& handedOut);

} // namespace store
