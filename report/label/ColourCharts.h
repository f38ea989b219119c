// SPDX-License-Identifier: Apache-2.0
// Where the colours of a result are in CIELAB, and where they should be.
#pragma once

#include "report/Model.h"
#include "report/label/Page.h"
#include "report/label/Typesetter.h"

namespace label {

/// Two charts side by side, a* against b* and chroma against lightness: a line from each target to
/// a dot at what was measured. The patches are those that the model chose to draw. Everything is
/// inside `area`, texts included.
void addColourCharts(Page& page, const Typesetter& typesetter, const Rect& area,
                     const report::Model& model, const report::Result& result);

} // namespace label
