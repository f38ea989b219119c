// SPDX-License-Identifier: Apache-2.0
// A notification on the operator's desktop.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>

namespace measuretool {

/// Shown by whatever serves org.freedesktop.Notifications on the session bus; there is none without
/// DBUS_SESSION_BUS_ADDRESS. A desktop that fails or does not answer within two seconds is not
/// asked again, and nobody learns of it: the notification is an offer beside the terminal.
///
/// The bus is spoken to with sd-bus. Its library is part of every Debian installation, and unlike a
/// program that shows notifications it need not be looked for or watched.
class Notification {
  public:
    Notification() = default;
    ~Notification(); ///< Takes the notification away.
    Notification(const Notification&) = delete;
    Notification& operator=(const Notification&) = delete;

    /// Shows some lines in place of those before. Throws Failure (Cancelled).
    void show(const std::string& title, std::initializer_list<std::string> lines);

  private:
    std::uint32_t m_number = 0; ///< As the desktop counts them; 0 if none is shown.
    bool m_failed = false;
};

} // namespace measuretool
