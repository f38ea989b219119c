// SPDX-License-Identifier: Apache-2.0
// One measurement, from the first patch to the last.
#pragma once

#include "colour/DataSet.h"
#include "companions/measure-tool/Instrument.h"
#include "companions/measure-tool/Progress.h"
#include "companions/measure-tool/Settings.h"

namespace measuretool {

/// Measures all patches of a chart, with the delay and the mishap that the settings specify. Throws
/// Failure: InstrumentFailed, Cancelled, and what the instrument throws.
colour::DataSet measureAll(const colour::DataSet& chart, Instrument& instrument,
                           const Settings& settings, Progress& progress);

} // namespace measuretool
