// SPDX-License-Identifier: Apache-2.0
// Prints patches through a profile, and measures the print.
#pragma once

#include <random>
#include <string>

#include "colour/Profile.h"
#include "companions/measure-tool/Instrument.h"
#include "companions/measure-tool/Reflectance.h"
#include "companions/measure-tool/Settings.h"

namespace measuretool {

/// Prints the profile's colours, absolute colorimetric, and adds Settings::bias and an error to
/// each patch. Errors follow a fixed sequence, row by row, so equal settings measure equal values.
class VirtualInstrument : public Instrument {
  public:
    /// `name` is that of the replaced instrument, or empty. The chart must outlive this object.
    /// Throws Failure: BadProfile, or NotMeasurable for patches that a CMYK press can't print.
    VirtualInstrument(const Settings& settings, const std::string& name,
                      const colour::DataSet& chart);

    void describe(colour::DataSet& measurement) const override;
    Reading measure(std::size_t patch) override;

  private:
    colour::Lab print(std::size_t patch) const;
    colour::Lab randomError();

    const colour::DataSet& m_chart;
    const std::string m_path; ///< Path of the profile.
    const std::string m_name;
    const double m_deviation; ///< Standard deviation of the error of L*, a* and b* each.
    const colour::Lab m_bias;
    const bool m_spectra;
    colour::Profile m_profile;
    std::mt19937_64 m_engine;
    const ReflectanceMaker m_reflectances;
};

} // namespace measuretool
