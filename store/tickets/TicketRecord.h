// SPDX-License-Identifier: Apache-2.0
// One ticket and the record of functions through which callers access it.
#pragma once

#include <memory>

#include "store/tickets/TicketContent.h"
#include "ticket/TicketRecords.h"

namespace store {

/// The operations of a ticket's record. Running out of memory is an exception; the record's
/// functions convert it to a failure.
class Ticket {
  public:
    virtual ~Ticket() = default;

    /// Reads one element, as described for readElement.
    virtual bool get(const char* key, PARAM_TYPE type, void* out, int position) = 0;

    /// The keys that the filter accepts, for a transfer. Null if the ticket does not exist.
    virtual std::shared_ptr<const TicketContent> content(const KeyFilter& filter) = 0;

    /// The whole ticket, for a walk. Null if it does not exist. Its keys and values keep their
    /// addresses until the ticket is changed through this object, however often it is walked.
    virtual std::shared_ptr<const TicketContent> shown() = 0;

    /// Like TicketContent::apply. If the ticket does not exist, returns false and sets no result.
    virtual bool apply(SETMULTIPAR* table) = 0;
    virtual bool transfer(const TicketContent& source, bool replace) = 0;

    /// For a ticket that belongs to no container, returns false and leaves the record unchanged.
    virtual bool whoAmI(STICKET_OPTION_WHOAMI& record) = 0;
};

/// The record of a ticket. Its functions find the ticket by the record's address, so handles and
/// sources that are not (or no longer) tickets are recognised without reading them.
class TicketRecord {
  public:
    explicit TicketRecord(std::shared_ptr<Ticket> ticket);
    ~TicketRecord();
    TicketRecord(const TicketRecord&) = delete;
    TicketRecord& operator=(const TicketRecord&) = delete;

    const STICKET_ACCESS* access() const { return &m_access; }

  private:
    STICKET_ACCESS m_access{};
};

/// The ticket with a record at this address, or null. The pointer keeps the ticket alive, even if
/// it is destroyed in a callback of its own walk.
std::shared_ptr<Ticket> findTicket(const void* record);

/// Runs the body; false if memory runs out.
template<class Body>
bool guarded(Body body) {
    try {
        return body();
    } catch (const std::bad_alloc&) {
    } catch (const std::length_error&) {
    }
    return false;
}

/// Reads a table's records one by one with get(key, type, out, position) and sets their results. A
/// null table does nothing.
template<class Get>
void getMultiple(GETMULTIPAR* table, Get get) {
    for (auto* record = table; record != nullptr && record->key != nullptr; ++record) {
        record->result =
            guarded([&] { return get(record->key, record->type, record->value, record->position); })
                ? 1
                : 0;
    }
}

/// Sets or deletes one element through apply(table).
template<class Apply>
bool setSingle(const char* key, PARAM_TYPE type, const void* value, int position, Apply apply) {
    SETMULTIPAR table[2];
    table[0].key = key;
    table[0].type = type;
    table[0].value = value;
    table[0].position = position;
    return key != nullptr && apply(table) && table[0].ok();
}

/// Applies a table through apply(table). If that fails, no result is set.
template<class Apply>
bool setMultiple(SETMULTIPAR* table, Apply apply) {
    if (table == nullptr) {
        return false;
    }
    clearResults(table);
    return apply(table);
}

} // namespace store
