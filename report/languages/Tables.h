// SPDX-License-Identifier: Apache-2.0
// The tables of texts as the build compiles them (compile.py).
#pragma once

#include <string_view>

namespace languages {

/// A text for a count of one and for all others; the same twice if no count matters.
struct Forms {
    std::string_view one;
    std::string_view other;
};

/// One table for each Language, in its order; entry i belongs to textKeys[i].
extern const Forms* const tables[];

} // namespace languages
