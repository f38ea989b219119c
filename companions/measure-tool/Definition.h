// The definition of the patches, as the tool writes it for whoever measures.
#pragma once

#include <string>

#include "colour/DataSet.h"

namespace measuring {

/// Reads a definition: ids, names and device values of its patches, in their order, without any
/// colours. Throws Failure (BadDefinition) where that can't be done.
///
/// All that the writer makes of a strip is read: references that are cut off at the end of their
/// rows, and filling rows that don't have the strip's columns, which become patches of paper.
colour::DataSet readDefinition(const std::string& path);

} // namespace measuring
