// SPDX-License-Identifier: Apache-2.0
// The versions in results. The build sets them.
#pragma once

namespace analysis {

inline constexpr char toolVersion[] = TINTGATE_TOOL_VERSION;
inline constexpr char libraryVersion[] = TINTGATE_LIBRARY_VERSION;

} // namespace analysis
