// SPDX-License-Identifier: Apache-2.0
// What a label or a certificate states, worked out of a result before anything has a place.
#pragma once

#include <string>
#include <vector>

#include "report/Model.h"
#include "report/label/CodeText.h"
#include "report/label/Details.h"
#include "report/label/Label.h"

namespace label {

/// A field with its text, which is not empty.
struct Entry {
    Field field;
    std::string label; ///< "Paper"
    std::string text;
    bool isKnown = true; ///< False for a field that a proof must state and that nothing states.
};

struct Content {
    std::string title;
    std::vector<Entry> entries; ///< In the order of Field.
    report::Model model;        ///< Criteria, histogram, patches and sentences.
    CodeText code;
    std::string toolVersion;
};

/// Everything that the subject states. Entries whose text is unknown are among them only if a
/// proof must state them.
Content contentOf(const Subject& subject);

/// "and 6 more: 2 failed, 4 passed", of the criteria from `first` on; "6 criteria: ..." of all.
std::string restText(const std::vector<report::Figure>& judged, std::size_t first);

} // namespace label
