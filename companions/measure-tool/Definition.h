// SPDX-License-Identifier: Apache-2.0
// The definition of the patches, as the tool writes it for the measuring tool.
#pragma once

#include <string>

#include "colour/DataSet.h"

namespace measuretool {

struct Definition {
    colour::DataSet chart; ///< Ids, names and device values of the patches, in order; no colours.
    std::string condition; ///< "M0" to "M3" of ISO 13655; empty if any is accepted.
};

/// Reads a definition. Throws Failure (BadDefinition) on failure.
///
/// Accepts everything that the writer makes of a strip: references cut off at the end of their
/// rows, and filling rows, which don't have the strip's columns and become patches of paper.
/// Refuses rows that may have lost ids or device values (see CutLines.h), and amounts of ink above
/// 100 %: columns of inks are in percent, columns of RGB may be 0 to 255.
Definition readDefinition(const std::string& path);

} // namespace measuretool
