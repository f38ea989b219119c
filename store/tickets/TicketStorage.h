// SPDX-License-Identifier: Apache-2.0
// Storage for the tickets of a server.
#pragma once

#include <memory>
#include <vector>

#include "store/tickets/TicketContent.h"

namespace store {

/// Tickets by type and id. Only stores and returns them; TicketContent defines the effect of a
/// table. Types and ids passed in are valid. Running out of memory is an exception.
class TicketStorage {
  public:
    virtual ~TicketStorage() = default;

    /// All tickets of a type, ascending.
    virtual std::vector<int> ids(int type) = 0;
    virtual bool exists(int type, int id) = 0;

    /// Creates an empty ticket with this id. False if there is one already.
    virtual bool create(int type, int id) = 0;
    /// Creates an empty ticket with an id that the type has not had yet. Returns the id, or -1.
    virtual int createNext(int type) = 0;
    virtual bool remove(int type, int id) = 0;

    /// One key in its current state; null if there is no such key or ticket.
    virtual std::shared_ptr<const Elements> key(int type, int id, std::string_view key) = 0;
    /// The keys that the filter accepts, at one moment; null if there is no such ticket.
    virtual std::shared_ptr<const TicketContent> content(int type, int id,
                                                         const KeyFilter& filter) = 0;

    /// Applies a table in one step, like TicketContent::apply. If there is no such ticket or it
    /// can't be written, returns false and sets no result.
    virtual bool apply(int type, int id, SETMULTIPAR* table) = 0;
    /// Transfers in one step, like TicketContent::transfer.
    virtual bool transfer(int type, int id, const TicketContent& source, bool replace) = 0;
};

} // namespace store
