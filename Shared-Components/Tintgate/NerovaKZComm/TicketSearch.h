// SPDX-License-Identifier: Apache-2.0
// Walks over the tickets of a container. Each function below is a TicketWalk and takes what its
// comment says as context.
#pragma once

#include <string>
#include <vector>

#include "ticket/TicketRecords.h"

/// The search for the first ticket that has a text.
struct stSearchKey {
    std::string key;
    std::string value;
    int ticketID = -1; ///< Of the ticket that was found.
};

/// The search for all tickets that have a value.
struct stSearchTickets {
    std::vector<int> ids; ///< Of the tickets that were found, as they were walked.
    std::string key;
    const void* value = nullptr; ///< An int or a NUL-terminated text.
    PARAM_TYPE type = PARAM_INT; ///< PARAM_INT or PARAM_STRING; nothing matches another type.
    bool inArray = false;        ///< Look among the elements, not at the single value.
};

/// Appends each ticket's id to a std::vector<int>.
bool WalkGetTicketIds(void* context, int type, int id, const STICKET_ACCESS* ticket);

/// Of an stSearchKey. Ends the walk at the first match.
bool WalkSearchTicket(void* context, int type, int id, const STICKET_ACCESS* ticket);

/// Of an stSearchTickets. Only integers are looked for in every ticket: for a text the walk ends
/// after the first ticket, whether it matched or not (C106).
bool WalkSearchTickets(void* context, int type, int id, const STICKET_ACCESS* ticket);
