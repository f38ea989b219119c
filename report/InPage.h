// SPDX-License-Identifier: Apache-2.0
// Data formats in a page.
#pragma once

#include <string>
#include <vector>

#include <nlohmann/json.hpp>

#include "report/Result.h"
#include "report/Swatch.h"
#include "report/languages/Texts.h"

namespace report {

using PageJson = nlohmann::ordered_json;

/// JSON that is safe in a script element: it can't end the element or start a comment.
std::string inScript(const PageJson& json);

/// The texts of a page's script, as inScript writes JSON.
std::string scriptTexts(const languages::Texts& say, const char* page);

/// The shortest text of the number; null where it is none.
void appendNumber(std::string& text, double value);

/// A list of numbers, rounded to `decimals` decimals, which is sufficient for drawing.
void appendRounded(std::string& text, const std::vector<double>& values, int decimals);

/// "#rrggbb", followed by "!" if it is clipped.
std::string swatchText(const Swatch& swatch);

/// A relative URL of a path: its bytes, with special characters of URLs escaped.
std::string linkTo(const std::string& path);

/// Class names in the style sheet: "passed", "failed", "incomplete", "unjudged".
const char* keyOf(Verdict verdict);
const char* keyOf(Outcome outcome);

} // namespace report
