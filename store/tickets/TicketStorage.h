// SPDX-License-Identifier: Apache-2.0
// The place where the tickets of a server are kept.
#pragma once

#include <memory>
#include <vector>

#include "store/tickets/TicketContent.h"

namespace store {

/// Tickets by type and id. It keeps and gives back; what a table does to a ticket is said by
/// TicketContent. Types and ids that it is given are valid. Running out of memory is an exception.
class TicketStorage {
  public:
    virtual ~TicketStorage() = default;

    /// Of all tickets of a type, ascending.
    virtual std::vector<int> ids(int type) = 0;
    virtual bool exists(int type, int id) = 0;

    /// An empty ticket under this id. False when there is one already.
    virtual bool create(int type, int id) = 0;
    /// An empty ticket under an id that the type has not had yet. Its id, or -1.
    virtual int createNext(int type) = 0;
    virtual bool remove(int type, int id) = 0;

    /// One key as it is now; null when there is no such key or ticket.
    virtual std::shared_ptr<const Elements> key(int type, int id, std::string_view key) = 0;
    /// The keys that the filter takes, all of one moment; null when there is no such ticket.
    virtual std::shared_ptr<const TicketContent> content(int type, int id,
                                                         const KeyFilter& filter) = 0;

    /// A table, as one step, as TicketContent::apply tells. False, and no result is set, when there
    /// is no such ticket or it can't be written.
    virtual bool apply(int type, int id, SETMULTIPAR* table) = 0;
    /// As one step, as TicketContent::transfer tells.
    virtual bool transfer(int type, int id, const TicketContent& source, bool replace) = 0;
};

} // namespace store
