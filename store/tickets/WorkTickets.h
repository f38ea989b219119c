// SPDX-License-Identifier: Apache-2.0
// Tickets that belong to no container, and the factory that makes them for callers.
#pragma once

#include "ticket/TicketRecords.h"

namespace store {

/// Creates and destroys work tickets. A name is accepted and not kept. Destroying nulls the
/// caller's pointer; it leaves alone what is no work ticket.
///
/// Texts that were read from work tickets stay good until the process ends.
const ticket::Factory* ticketFactory();

} // namespace store
