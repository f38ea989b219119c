// SPDX-License-Identifier: Apache-2.0
// The pages' HTML as the build assembles it (embed.py), cut at its holes.
#pragma once

#include <functional>
#include <span>
#include <string>
#include <string_view>

#include "report/languages/Texts.h"

namespace report {

/// A piece of a page, and the hole that follows it; no hole follows the last one.
struct Piece {
    std::string_view text;
    std::string_view hole; ///< Such as "summary", or "text page.criteria".
};

extern const std::span<const Piece> pageTemplate;
extern const std::span<const Piece> indexTemplate; ///< The list of reports.
extern const std::span<const Piece> trendTemplate;

/// The whole page. `fill` appends what belongs into a hole; texts and the hole "lang" are filled in
/// without it.
std::string assembled(std::span<const Piece> pieces, const languages::Texts& say,
                      const std::function<void(std::string_view hole, std::string& page)>& fill);

} // namespace report
