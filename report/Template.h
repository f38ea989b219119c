// SPDX-License-Identifier: Apache-2.0
// The pages' HTML as the build assembles it (embed.py), cut where the data goes in.
#pragma once

#include <string_view>

namespace report {

extern const std::string_view pageTemplate[3];  ///< Summary, then data.
extern const std::string_view indexTemplate[2]; ///< The list of reports.
extern const std::string_view trendTemplate[2]; ///< The trend's data.

} // namespace report
