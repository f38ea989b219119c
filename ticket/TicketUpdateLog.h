// SPDX-License-Identifier: Apache-2.0
// The diagnostic sink of a ticket update list.
#pragma once

/// Receives one line for each event of a list and its flush. This version stores and writes nothing
/// (C141), but arguments are still evaluated. It has a source file of its own so that a program can
/// be linked with a sink that writes.
class clTICKET_UPDATE_LOG {
  public:
    explicit clTICKET_UPDATE_LOG(const char* name);

    void printf(const char* format, ...) __attribute__((format(printf, 2, 3)));
    void close();
};

namespace ticket {

inline constexpr const char* updateLogName = "TicketUpdate.txt";

} // namespace ticket
