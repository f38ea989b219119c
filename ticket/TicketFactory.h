// SPDX-License-Identifier: Apache-2.0
// Tickets that belong to no container: scratch and delta tickets (C160).
#pragma once

#include "ticket/TicketRecords.h"

/// The plug-in's factory, or null if no plug-in is loaded. The connection to the server sets it.
extern const ticket::Factory* hSTicketInstance;

/// Returns an empty ticket, to be released with DestroyTicket. Null without a factory and if the
/// factory refuses. All callers pass a null name.
const STICKET_ACCESS* CreateTicket(const char* name);

/// Releases a ticket of CreateTicket; the factory gets the caller's pointer. Does nothing without a
/// factory.
void DestroyTicket(const STICKET_ACCESS*& access);
