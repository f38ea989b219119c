// SPDX-License-Identifier: Apache-2.0
// Callbacks for walks over the tickets of a container. Each function below is a TicketWalk; its
// comment names the context that it expects.
#pragma once

#include <string>
#include <vector>

#include "ticket/TicketRecords.h"

/// Search for the first ticket with a text.
struct stSearchKey {
    std::string key;
    std::string value;
    int ticketID = -1; ///< The ticket found.
};

/// Search for all tickets with a value.
struct stSearchTickets {
    std::vector<int> ids; ///< The tickets found, in walk order.
    std::string key;
    const void* value = nullptr; ///< An int or a NUL-terminated text.
    PARAM_TYPE type = PARAM_INT; ///< PARAM_INT or PARAM_STRING; other types match nothing.
    bool inArray = false;        ///< Compare the elements, not the single value.
};

/// Context: a std::vector<int>, to which each ticket's id is appended.
bool WalkGetTicketIds(void* context, int type, int id, const STICKET_ACCESS* ticket);

/// Context: an stSearchKey. Ends the walk at the first match.
bool WalkSearchTicket(void* context, int type, int id, const STICKET_ACCESS* ticket);

/// Context: an stSearchTickets. For a text, the walk ends after the first ticket even without a
/// match; only integers are compared in every ticket (C106).
bool WalkSearchTickets(void* context, int type, int id, const STICKET_ACCESS* ticket);
