// SPDX-License-Identifier: Apache-2.0
// The histogram of a result's differences.
#pragma once

#include "report/Model.h"
#include "report/label/Page.h"
#include "report/label/Typesetter.h"

namespace label {

/// Bins as bars, with the marks of the model as lines. Bars above the limit of a single patch are
/// hatched. Everything is inside `area`, texts included.
void addHistogram(Page& page, const Typesetter& typesetter, const Rect& area,
                  const report::Model& model);

} // namespace label
