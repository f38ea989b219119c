// SPDX-License-Identifier: Apache-2.0
// What there is to compare with.
#pragma once

#include <string>

#include "companions/tintgate-check/Conditions.h"
#include "companions/tintgate-report/Terminal.h"

namespace check {

/// Conditions, presets, and the data sets that can serve as targets, with what they say of
/// themselves. A file of the folders that is no data for print is left out.
std::string listText(const Conditions& conditions, const report::Painter& paint);

} // namespace check
