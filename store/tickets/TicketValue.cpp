// SPDX-License-Identifier: Apache-2.0
#include "store/tickets/TicketValue.h"

#include <cstring>
#include <string_view>
#include <type_traits>

namespace store {

namespace {

template<PARAM_TYPE Type>
using Kept = std::variant_alternative_t<Type, Value>;

static_assert(std::is_same_v<Kept<PARAM_POINTER>, void*> && std::is_same_v<Kept<PARAM_INT>, int> &&
              std::is_same_v<Kept<PARAM_DOUBLE>, double> &&
              std::is_same_v<Kept<PARAM_STRING>, Text> &&
              std::is_same_v<Kept<PARAM_BINARY>, Binary> &&
              std::is_same_v<Kept<PARAM_INT64>, long long> &&
              std::is_same_v<Kept<PARAM_UINT>, unsigned int> &&
              std::is_same_v<Kept<PARAM_UINT64>, unsigned long long>);

/// Callers' pointers may be unaligned.
template<class T>
T load(const void* from) {
    T value;
    std::memcpy(&value, from, sizeof value);
    return value;
}

template<class T>
void put(void* to, const T& value) {
    std::memcpy(to, &value, sizeof value);
}

std::optional<Value> takeBinary(const void* value) {
    const auto bytes = load<BIN_STRING>(value);
    if (bytes.length == 0) {
        return Binary{std::make_shared<Bytes>(std::string())};
    }
    if (bytes.data == nullptr) {
        return std::nullopt;
    }
    return Binary{std::make_shared<Bytes>(std::string(bytes.data, bytes.length))};
}

} // namespace

std::optional<Value> takeValue(PARAM_TYPE type, const void* value) {
    if (type == PARAM_POINTER) {
        return const_cast<void*>(value);
    }
    if (value == nullptr) {
        return std::nullopt;
    }
    switch (type) {
    case PARAM_INT:
        return load<int>(value);
    case PARAM_DOUBLE:
        return load<double>(value);
    case PARAM_STRING:
        return Text{std::make_shared<Bytes>(static_cast<const char*>(value))};
    case PARAM_BINARY:
        return takeBinary(value);
    case PARAM_INT64:
        return load<long long>(value);
    case PARAM_UINT:
        return load<unsigned int>(value);
    case PARAM_UINT64:
        return load<unsigned long long>(value);
    default:
        return std::nullopt;
    }
}

const void* valuePointer(const Value& value) {
    return std::visit(
        [](const auto& kept) -> const void* {
            using T = std::decay_t<decltype(kept)>;
            if constexpr (std::is_same_v<T, void*>) {
                return kept;
            } else if constexpr (std::is_same_v<T, Text>) {
                return kept.bytes->text.c_str();
            } else if constexpr (std::is_same_v<T, Binary>) {
                return &kept.bytes->view;
            } else {
                return &kept;
            }
        },
        value);
}

void giveValue(const Value& value, void* out, HandedOut& handedOut) {
    std::visit(
        [&](const auto& kept) {
            using T = std::decay_t<decltype(kept)>;
            if constexpr (std::is_same_v<T, Text>) {
                put(out, handedOut.keep(kept.bytes).text.c_str());
            } else if constexpr (std::is_same_v<T, Binary>) {
                put(out, handedOut.keep(kept.bytes).view);
            } else if constexpr (!std::is_empty_v<T>) {
                put(out, kept);
            }
        },
        value);
}

std::size_t HandedOut::Content::operator()(const SharedBytes& bytes) const {
    return std::hash<std::string_view>()(bytes->text);
}

bool HandedOut::Content::operator()(const SharedBytes& a, const SharedBytes& b) const {
    return a == b || a->text == b->text;
}

const Bytes& HandedOut::keep(const SharedBytes& bytes) {
    return **m_bytes.insert(bytes).first;
}

} // namespace store
