// SPDX-License-Identifier: Apache-2.0
// A measurement that an instrument's own software has exported.
#pragma once

#include <cstddef>
#include <vector>

#include "companions/measure-tool/Definition.h"
#include "companions/measure-tool/Instrument.h"
#include "companions/measure-tool/Operator.h"
#include "companions/measure-tool/Settings.h"

namespace measuretool {

/// Hands over what was exported for the patches of a definition.
class ExportedMeasurement : public Instrument {
  public:
    /// Takes the file that is there. With a time to wait, it asks the operator instead and takes a
    /// file that is newly written: it differs from the one that was there, and has come to rest.
    /// A file that can't be accepted is reported to the operator, and the wait goes on; when the
    /// time is up, the last such problem is the failure.
    ///
    /// Throws Failure: BadExport, OtherPatches, OtherCondition, Cancelled.
    ExportedMeasurement(const Settings& settings, const Definition& definition, Operator& person);

    void describe(colour::DataSet& measurement) const override;
    Reading measure(std::size_t patch) override;

  private:
    colour::DataSet m_set;
    std::vector<std::size_t> m_rows; ///< Of each patch of the chart.
};

} // namespace measuretool
