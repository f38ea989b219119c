// SPDX-License-Identifier: Apache-2.0
// Tone value increase of inks.
#pragma once

#include <cstddef>

#include "report/Model.h"
#include "report/label/Page.h"
#include "report/label/Typesetter.h"

namespace label {

inline constexpr std::size_t mostToneCharts = 4; ///< Beside each other.

/// A chart for each of the first inks of the model: measured tone values less nominal ones as black
/// dots and lines, their aims as a grey line. A value beyond its tolerance is a larger, hatched
/// square. Everything is inside `area`, texts included.
void addToneCharts(Page& page, const Typesetter& typesetter, const Rect& area,
                   const report::Model& model);

} // namespace label
