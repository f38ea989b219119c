// SPDX-License-Identifier: Apache-2.0
// The value that a reader of one value gets: a key's first element, if it has the requested type.
#pragma once

#include <memory>
#include <optional>
#include <string>

#include "store/tickets/TicketContent.h"

namespace admin {

template<class T>
const T* firstOf(const std::shared_ptr<const store::Elements>& elements) {
    const auto* const value = elements ? elements->first() : nullptr;
    return value != nullptr ? std::get_if<T>(value) : nullptr;
}

inline std::optional<int> integerOf(const std::shared_ptr<const store::Elements>& elements) {
    const int* const number = firstOf<int>(elements);
    return number != nullptr ? std::optional(*number) : std::nullopt;
}

inline std::optional<std::string> textOf(const std::shared_ptr<const store::Elements>& elements) {
    const auto* const text = firstOf<store::Text>(elements);
    return text != nullptr ? std::optional(text->bytes->text) : std::nullopt;
}

} // namespace admin
