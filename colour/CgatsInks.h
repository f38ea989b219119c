// SPDX-License-Identifier: Apache-2.0
// Names of the inks other than C, M, Y and K, from reliable parts of a header.
#pragma once

#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "colour/DataSet.h"

namespace colour::cgats {

/// Collects statements. Names of channels (LGOMCCHANNEL01) have priority over the letters of
/// COLOR_REP. PLUS_1_COLOR and similar keywords are ignored, because exporters write them with
/// defaults.
class InkNames {
  public:
    /// `keyword` in upper case, `value` in UTF-8.
    void see(std::string_view keyword, std::string_view value);

    /// Renames the channels after the first four to "SPOT_" plus the ink's name, if all of them are
    /// named and the first four are C, M, Y and K.
    void name(DataSet& set) const;

  private:
    std::map<int, std::string> m_channels; ///< Numbered from 1.
    std::vector<std::string> m_letters;    ///< From COLOR_REP, after CMYK.
};

} // namespace colour::cgats
