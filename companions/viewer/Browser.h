// SPDX-License-Identifier: Apache-2.0
// The user's browser.
#pragma once

#include <string>

namespace viewer {

/// True if there is a display (X11 or Wayland).
bool hasDisplay();

/// Opens a file with the desktop's opener and does not wait for it. If that can't be started,
/// returns false with the reason in `problem`.
bool openFile(const std::string& path, std::string& problem);

} // namespace viewer
