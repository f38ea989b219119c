// A server of the real engine for the tests of update lists.
#pragma once

#include "RealTickets.h"
#include "TicketText.h"
#include "ticket/TicketUpdateList.h"

constexpr int jobs = 3; ///< The type of its tickets.

class Server {
  public:
    Server() : engine(std::make_shared<store::MemoryKeep>()), record(*engine.access()) {
        hSTicketInstance = store::ticketFactory();
    }

    void create(int id, const std::string& content) {
        engine.createWithKeys(jobs, id, nullptr);
        engine.apply(jobs, id, support::RecordTable(content).records());
    }
    std::string content(int id) { return support::ticketText(engine.open(jobs, id)); }

    store::TicketContainer engine;
    MTICKET_ACCESS record;
};

/// Sets and deletions as RecordTable reads them; false as soon as one is refused.
inline bool edit(TICKET_UPDATE_LIST& list, int type, int id, const std::string& edits) {
    support::RecordTable table(edits);
    const SETMULTIPAR* r = table.records();
    while (r->key != nullptr &&
           list.xSetParameter(type, id, r->key, r->type, r->value, r->position, false)) {
        ++r;
    }
    return r->key == nullptr;
}
