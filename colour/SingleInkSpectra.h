// SPDX-License-Identifier: Apache-2.0
// Spectra of the few patches that tone values are made of, without reading those of all others.
#pragma once

#include <string_view>

#include "colour/CgatsText.h"

namespace colour {

/// Reads a text as readCgats does with wants.spectra, but spectra only of paper and of single inks;
/// DataSet::spectrumRows names these. Most patches of a chart are overprints, and spectra are most
/// of a text. Texts that are not a plain table (one row a line, one table) are read in full, and so
/// are those without process inks.
Failure readWithSingleInkSpectra(std::string_view bytes, const CgatsWants& wants, DataSet& set);

} // namespace colour
