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

/// Prints what the profile says, absolute colorimetric, and adds Settings::bias and an error to
/// each patch. Errors follow a fixed sequence, a row after the other, so that equal settings
/// measure equal values.
class VirtualInstrument : public Instrument {
  public:
    /// `name` is that of the instrument that it stands for; may be empty. The chart outlives it.
    /// Throws Failure: BadProfile, or NotMeasurable for patches that no CMYK press prints.
    VirtualInstrument(const Settings& settings, const std::string& name,
                      const colour::DataSet& chart);

    void describe(colour::DataSet& measurement) const override;
    Reading measure(std::size_t patch) override;

  private:
    colour::Lab print(std::size_t patch) const;
    colour::Lab randomError();

    const colour::DataSet& m_chart;
    const std::string m_path; ///< Of the profile.
    const std::string m_name;
    const double m_deviation; ///< Of an error, for each of L*, a* and b*.
    const colour::Lab m_bias;
    const bool m_spectra;
    colour::Profile m_profile;
    std::mt19937_64 m_engine;
    const ReflectanceMaker m_reflectances;
};

} // namespace measuretool
