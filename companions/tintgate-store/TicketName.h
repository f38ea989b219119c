// SPDX-License-Identifier: Apache-2.0
// Tickets by the names that people give them.
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

/// From "job/7", "preset/1", "system" or, for any type, "TYPE/ID" such as "12/3". Throws Failure
/// for anything else, and for types above 49 and ids above 16,777,215.
TicketName ticketNamed(const std::string& text);

/// The id of a job, from "7" or "job/7".
int jobNumber(const std::string& text);

/// From "job", "preset", "system" or a number.
int typeNamed(const std::string& text);

std::string textOf(const TicketName& name);

/// A whole number in decimal digits and nothing else. Throws Failure, which calls it `what`, where
/// it is none or lies outside.
int wholeNumber(const std::string& text, int lowest, int highest, const std::string& what);

} // namespace admin
