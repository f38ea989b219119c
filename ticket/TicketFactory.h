// SPDX-License-Identifier: Apache-2.0
// Tickets that belong to no container: scratch and delta tickets (C160).
#pragma once

#include "ticket/TicketRecords.h"

/// The plug-in's factory; null until a plug-in is there. The connection to the server sets it.
extern const ticket::Factory* hSTicketInstance;

/// An empty ticket, to be given back with DestroyTicket. Null without a factory and where the
/// factory refuses. All callers pass a null name.
const STICKET_ACCESS* CreateTicket(const char* name);

/// Gives a ticket of CreateTicket back; the factory is handed the caller's pointer. Nothing happens
/// without a factory.
void DestroyTicket(const STICKET_ACCESS*& access);
