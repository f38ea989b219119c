// SPDX-License-Identifier: Apache-2.0
// One ticket behind the record of functions through which callers reach it.
#pragma once

#include <memory>

#include "store/tickets/TicketContent.h"
#include "ticket/TicketRecords.h"

namespace store {

/// What the words of a ticket's record do. Running out of memory is an exception; the words turn it
/// into a failure.
class Ticket {
  public:
    virtual ~Ticket() = default;

    /// One element, as readElement tells.
    virtual bool get(const char* key, PARAM_TYPE type, void* out, int position) = 0;

    /// The keys that the filter takes, for a transfer; null when the ticket is not there.
    virtual std::shared_ptr<const TicketContent> content(const KeyFilter& filter) = 0;

    /// The whole ticket, for a walk; null when it is not there. Its keys and values stay at their
    /// addresses until the ticket changes through this object, however often it is walked.
    virtual std::shared_ptr<const TicketContent> shown() = 0;

    /// As TicketContent::apply tells. False, and no result is set, when the ticket is not there.
    virtual bool apply(SETMULTIPAR* table) = 0;
    virtual bool transfer(const TicketContent& source, bool replace) = 0;

    /// False, and the record is untouched, for a ticket that belongs to no container.
    virtual bool whoAmI(STICKET_OPTION_WHOAMI& record) = 0;
};

/// The record of a ticket. Its words find the ticket by the address of the record, so that a handle
/// or a source that is no ticket (any more) is recognised without being looked into.
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

/// The ticket whose record stands at an address; null for anything else. Holding it keeps the
/// ticket alive, be it destroyed from a callback of its own walk.
std::shared_ptr<Ticket> findTicket(const void* record);

/// Runs one word: false when memory runs out.
template<class Body>
bool guarded(Body body) {
    try {
        return body();
    } catch (const std::bad_alloc&) {
    } catch (const std::length_error&) {
    }
    return false;
}

/// Reads a table's records one by one with get(key, type, out, position), and sets each one's
/// result. A null table does nothing.
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

/// Applies a table through apply(table). No result is set unless that was done.
template<class Apply>
bool setMultiple(SETMULTIPAR* table, Apply apply) {
    if (table == nullptr) {
        return false;
    }
    for (auto* record = table; record->key != nullptr; ++record) {
        record->result = 0;
    }
    return apply(table);
}

} // namespace store
