// SPDX-License-Identifier: Apache-2.0
// How data stand in a page.
#pragma once

#include <string>
#include <vector>

#include <nlohmann/json.hpp>

#include "report/Result.h"
#include "report/Swatch.h"
#include "report/languages/Texts.h"

namespace report {

using PageJson = nlohmann::ordered_json;

/// JSON that can stand in a script element: nothing in it can end the element or open a comment.
std::string inScript(const PageJson& json);

/// The texts of a page's script, as inScript writes JSON.
std::string scriptTexts(const languages::Texts& say, const char* page);

/// The shortest text of the number; null where it is none.
void appendNumber(std::string& text, double value);

/// Numbers as a list, rounded to so many decimals: a page draws them and needs no more.
void appendRounded(std::string& text, const std::vector<double>& values, int decimals);

/// "#rrggbb", with "!" behind it where it is clipped.
std::string swatchText(const Swatch& swatch);

/// A relative URL of a path: its bytes, with all that means something in a URL escaped.
std::string linkTo(const std::string& path);

/// The names of classes in the style sheet: "passed", "failed", "incomplete", "unjudged".
const char* keyOf(Verdict verdict);
const char* keyOf(Outcome outcome);

} // namespace report
