// SPDX-License-Identifier: Apache-2.0
// What measures patches.
#pragma once

#include <cstddef>
#include <vector>

#include "colour/DataSet.h"

namespace measuretool {

/// What an instrument says of one patch.
struct Reading {
    colour::Lab lab;
    colour::Xyz xyz;
    std::vector<double> spectrum; ///< As many values as the instrument's axis has.
};

class Instrument {
  public:
    Instrument() = default;
    virtual ~Instrument() = default;
    Instrument(const Instrument&) = delete;
    Instrument& operator=(const Instrument&) = delete;

    /// Fills in who measures and under which conditions, and the axis of the spectra, if there are
    /// any. Knows nothing of patches.
    virtual void describe(colour::DataSet& measurement) const = 0;

    /// Measures a patch of the chart, each once and in their order. May throw Failure.
    virtual Reading measure(std::size_t patch) = 0;
};

} // namespace measuretool
