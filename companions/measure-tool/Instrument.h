// SPDX-License-Identifier: Apache-2.0
// The interface of an instrument.
#pragma once

#include <cstddef>
#include <vector>

#include "colour/DataSet.h"

namespace measuretool {

/// The reading of one patch.
struct Reading {
    colour::Lab lab;
    colour::Xyz xyz;
    std::vector<double> spectrum; ///< As many values as the instrument's spectral axis.
};

class Instrument {
  public:
    Instrument() = default;
    virtual ~Instrument() = default;
    Instrument(const Instrument&) = delete;
    Instrument& operator=(const Instrument&) = delete;

    /// Fills in the instrument, its conditions, and the axis of the spectra, if any, but no
    /// patches.
    virtual void describe(colour::DataSet& measurement) const = 0;

    /// Measures a patch of the chart. Called once for each patch, in order. May throw Failure.
    virtual Reading measure(std::size_t patch) = 0;
};

} // namespace measuretool
