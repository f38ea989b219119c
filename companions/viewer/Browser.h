// SPDX-License-Identifier: Apache-2.0
// The user's browser.
#pragma once

#include <string>

namespace viewer {

/// True if there is a display to show something on (X11 or Wayland).
bool hasDisplay();

/// Starts the desktop's own opener with a file, and does not wait for it. False with the reason in
/// `problem` if it can't be started.
bool openFile(const std::string& path, std::string& problem);

} // namespace viewer
