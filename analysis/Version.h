// SPDX-License-Identifier: Apache-2.0
// Versions as the results state them. The build gives them.
#pragma once

namespace analysis {

inline constexpr char toolVersion[] = TINTGATE_TOOL_VERSION;
inline constexpr char libraryVersion[] = TINTGATE_LIBRARY_VERSION;

} // namespace analysis
