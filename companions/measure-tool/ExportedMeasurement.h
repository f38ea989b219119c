// A measurement that an instrument's own software has exported.
#pragma once

#include "companions/measure-tool/Instrument.h"
#include "companions/measure-tool/Settings.h"

namespace measuring {

/// Hands over what was exported for the patches of a chart.
class ExportedMeasurement : public Instrument {
  public:
    /// Takes the file that is there or, with a time to wait, one that is newly written: it differs
    /// from the one that was there, and has come to rest. Throws Failure: BadExport, OtherPatches,
    /// Cancelled.
    ExportedMeasurement(const Settings& settings, const colour::DataSet& chart);

    void describe(colour::DataSet& measurement) const override;
    Reading measure(std::size_t patch) override;

  private:
    colour::DataSet m_set;
    std::vector<std::size_t> m_rows; ///< Of each patch of the chart.
};

} // namespace measuring
