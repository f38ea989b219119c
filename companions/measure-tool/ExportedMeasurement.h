// SPDX-License-Identifier: Apache-2.0
// A measurement exported by an instrument's own software.
#pragma once

#include <cstddef>
#include <vector>

#include "companions/measure-tool/Definition.h"
#include "companions/measure-tool/Instrument.h"
#include "companions/measure-tool/Operator.h"
#include "companions/measure-tool/Settings.h"

namespace measuretool {

/// Returns exported values for the patches of a definition.
class ExportedMeasurement : public Instrument {
  public:
    /// Takes the existing file. With a time to wait, asks the operator and takes a newly written
    /// file: one that differs from the existing file and no longer changes. A file that can't be
    /// accepted is reported to the operator, and the wait continues. When the time is up, the last
    /// such problem is the failure.
    ///
    /// Throws Failure: BadExport, OtherPatches, OtherCondition, Cancelled.
    ExportedMeasurement(const Settings& settings, const Definition& definition, Operator& person);

    void describe(colour::DataSet& measurement) const override;
    Reading measure(std::size_t patch) override;

  private:
    colour::DataSet m_set;
    std::vector<std::size_t> m_rows; ///< Row of each patch of the chart.
};

} // namespace measuretool
