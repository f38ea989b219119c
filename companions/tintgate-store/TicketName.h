// SPDX-License-Identifier: Apache-2.0
// Tickets by their names for people.
#pragma once

#include <string>

#include "jobkeys/Tickets.h"

namespace admin {

using jobkeys::jobType;
using jobkeys::presetType;

struct TicketName {
    int type = 0;
    int id = 0;

    auto operator<=>(const TicketName&) const = default;
};

/// Parses "job/7", "preset/1", "system" or, for any type, "TYPE/ID" such as "12/3". Throws Failure
/// for anything else, and for types above 49 and ids above 16,777,215.
TicketName ticketNamed(const std::string& text);

/// The id of a job, from "7" or "job/7".
int jobNumber(const std::string& text);

/// From "job", "preset", "system" or a number.
int typeNamed(const std::string& text);

std::string textOf(const TicketName& name);

/// An integer in decimal digits, without anything else. Throws Failure, which calls it `what`, if
/// it is invalid or out of range.
int wholeNumber(const std::string& text, int lowest, int highest, const std::string& what);

} // namespace admin
