// SPDX-License-Identifier: Apache-2.0
// One value of a ticket, as the plug-in keeps it.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <unordered_set>
#include <variant>

#include "ticket/ParameterRecords.h"

namespace store {

/// Bytes that never change, so that tickets share them and readers keep pointers into them.
struct Bytes {
    explicit Bytes(std::string bytes) : text(std::move(bytes)), view(text) {}
    Bytes(const Bytes&) = delete;
    Bytes& operator=(const Bytes&) = delete;

    const std::string text;
    const BIN_STRING view; ///< On text; data is not null, even of no bytes.
};
using SharedBytes = std::shared_ptr<const Bytes>;

/// A position of a key at which nothing stands.
struct Hole {};
/// Bytes without a zero byte.
struct Text {
    SharedBytes bytes;
};
struct Binary {
    SharedBytes bytes;
};
struct NeverKept {};

/// The alternatives stand in the order of PARAM_TYPE, so that index() is the type.
using Value = std::variant<Hole, void*, int, double, Text, Binary, NeverKept, long long,
                           unsigned int, unsigned long long>;

inline PARAM_TYPE typeOf(const Value& value) {
    return static_cast<PARAM_TYPE>(value.index());
}

/// The texts and binaries that readers hold. Each lives until the object ends, and equal ones are
/// kept once, so that the room grows with the number of different values only.
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

/// A copy of what a record of this type points to. Nothing when it can't be kept: a type that has
/// no value, an unknown type, a null value except of a PARAM_POINTER, bytes that are nowhere.
std::optional<Value> takeValue(PARAM_TYPE type, const void* value);

/// The pointer that shows the value in a walk; it stays good as long as the value stands.
const void* valuePointer(const Value& value);

/// Writes the value to the place that a record of its type points to.
void giveValue(const Value& value, void* out, HandedOut& handedOut);

} // namespace store
