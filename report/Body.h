// SPDX-License-Identifier: Apache-2.0
// What a page shows without a script: verdict, conditions, criteria, and what was compared.
#pragma once

#include <string_view>

#include "report/Html.h"
#include "report/Model.h"

namespace report {

/// What the page has for a hole (page.html), such as "verdict" or "criteria". Empty for a name that
/// is no hole of the body.
Html bodyPart(std::string_view hole, const Model& model, const languages::Texts& say);

/// ✓, ✕ or ?
std::string_view signOf(Verdict verdict);

/// The sign with its word.
Html badge(Verdict verdict, const std::string& word);

} // namespace report
