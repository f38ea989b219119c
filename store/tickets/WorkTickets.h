// SPDX-License-Identifier: Apache-2.0
// Tickets that belong to no container, and the factory that creates them.
#pragma once

#include "ticket/TicketRecords.h"

namespace store {

/// Creates and destroys work tickets. A name is accepted and ignored. Destroying a ticket sets the
/// caller's pointer to null; anything that is not a work ticket is left alone.
///
/// Texts read from work tickets are valid until the process ends.
const ticket::Factory* ticketFactory();

} // namespace store
