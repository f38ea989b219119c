// SPDX-License-Identifier: Apache-2.0
// Where everything goes on a label.
//
// A wide label has its code at the right; any other has it at the bottom:
//
//     +----------------------------------+     +----------------+
//     | [v PASSED] Title          ####   |     | [x FAILED]     |
//     | --------------------      ####   |     | Title          |
//     | Condition: ..  Criteria   ####   |     | -------------- |
//     | Preset: ..     v ..  1/3  SHA..  |     | Condition: ..  |
//     | Paper: ..      v ..  2/3  ______ |     | Criteria       |
//     +----------------------------------+     | ####  SHA..    |
//                                              | ####  ______   |
//                                              +----------------+
//
// Fields and criteria share one font size: the largest at which everything fits, down to
// `smallestPoints`. If that is not enough, the last criteria are counted rather than listed, and
// then fields go in the order of docs/labels.md.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "report/label/Content.h"
#include "report/label/Page.h"
#include "report/label/Typesetter.h"

namespace label {

inline constexpr double smallestPoints = 6;
inline constexpr double largestPoints = 11;

struct LabelLayout {
    Page page;
    std::vector<std::string> leftOut; ///< Labels of the fields that had no room.
    std::size_t criteriaCounted = 0;  ///< Criteria that are only counted.
};

/// A dot of the coarsest usual label printers, in millimetres.
inline constexpr double usualDot = 25.4 / 203;

/// `size` must be in the range of sizeOf(). The code's modules are whole dots of `dot` millimetres.
LabelLayout layOutLabel(const Content& content, const Size& size, double dot,
                        const Typesetter& typesetter);

} // namespace label
