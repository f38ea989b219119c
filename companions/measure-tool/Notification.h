// SPDX-License-Identifier: Apache-2.0
// A notification on the operator's desktop.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>

namespace measuretool {

/// Shown by the service org.freedesktop.Notifications on the session bus; without
/// DBUS_SESSION_BUS_ADDRESS there is none. If the desktop fails or does not answer within two
/// seconds, it is not asked again, and no error is reported: the notification only supplements the
/// terminal.
///
/// Uses sd-bus, which every Debian installation has, instead of a program that has to be found.
class Notification {
  public:
    Notification() = default;
    ~Notification(); ///< Closes the notification.
    Notification(const Notification&) = delete;
    Notification& operator=(const Notification&) = delete;

    /// Shows some lines, replacing the previous ones. Throws Failure (Cancelled).
    void show(const std::string& title, std::initializer_list<std::string> lines);

  private:
    std::uint32_t m_number = 0; ///< Assigned by the desktop; 0 if none is shown.
    bool m_failed = false;
};

} // namespace measuretool
