// SPDX-License-Identifier: Apache-2.0
// Names of the inks beside C, M, Y and K, from where a header states them reliably.
#pragma once

#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "colour/DataSet.h"

namespace colour::cgats {

/// Gathers statements. Names of channels (LGOMCCHANNEL01) count before the letters of COLOR_REP.
/// PLUS_1_COLOR and its like do not count: they are met with the exporter's defaults.
class InkNames {
  public:
    /// `keyword` in capitals, `value` UTF-8.
    void see(std::string_view keyword, std::string_view value);

    /// Renames the channels after the first four to "SPOT_" and the ink's name, if all of them are
    /// named and the first four are C, M, Y and K.
    void name(DataSet& set) const;

  private:
    std::map<int, std::string> m_channels; ///< From 1.
    std::vector<std::string> m_letters;    ///< Of COLOR_REP, after CMYK.
};

} // namespace colour::cgats
