// SPDX-License-Identifier: Apache-2.0
// Tickets of the real engine for tests. Records are copied, so that a test can replace single
// words.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "TicketText.h"
#include "store/tickets/MemoryStorage.h"
#include "store/tickets/TicketContainer.h"
#include "store/tickets/WorkTickets.h"
#include "ticket/TicketContainer.h"
#include "ticket/TicketFactory.h"
#include "ticket/TicketUpdateList.h"
#include "ticket/TicketViews.h"

constexpr int jobs = 3; ///< The type of a job's tickets.

/// A work ticket, accessed through its own record.
class WorkTicket {
  public:
    explicit WorkTicket(const std::string& content = "") {
        hSTicketInstance = store::ticketFactory();
        m_real = CreateTicket(nullptr);
        record = *m_real;
        EXPECT_EQ(send(content).find('0'), std::string::npos) << content;
    }
    ~WorkTicket() { destroy(); }
    void destroy() { DestroyTicket(m_real); }
    WorkTicket(const WorkTicket&) = delete;
    WorkTicket& operator=(const WorkTicket&) = delete;

    const STICKET_MODIFY& view() const { return ticket::as<STICKET_MODIFY>(record); }
    /// The engine's own record, required as the source of a transfer.
    const STICKET_ACCESS* real() const { return m_real; }

    /// Sends a table and returns the results of its records.
    std::string send(const std::string& records) const {
        support::RecordTable table(records);
        table.records()->result = 1;
        view().SetMultiParameter(table.records());
        return support::resultText(table.records());
    }
    std::string content() const { return support::ticketText(m_real); }

    template<class Call>
    auto with(Call call) const {
        return call(view());
    }

    STICKET_ACCESS record;

  private:
    const STICKET_ACCESS* m_real;
};

inline std::shared_ptr<store::TicketStorage> memoryKeep() {
    return std::make_shared<store::MemoryStorage>();
}

/// Creates the tickets' storage for a new Server, unless one is given.
inline std::function<std::shared_ptr<store::TicketStorage>()> newKeep = memoryKeep;

/// A session with a server.
class Server {
  public:
    explicit Server(std::shared_ptr<store::TicketStorage> place = newKeep())
        : keep(std::move(place)), engine(keep), record(*engine.access()) {
        hSTicketInstance = store::ticketFactory();
    }

    const MTICKET_ADMIN& view() const { return ticket::as<MTICKET_ADMIN>(record); }

    void create(int id, const std::string& content = "") {
        engine.createWithKeys(jobs, id, nullptr);
        engine.apply(jobs, id, support::RecordTable(content).records());
    }
    std::string send(int id, const std::string& records, int type = jobs) const {
        support::RecordTable table(records);
        table.records()->result = 1;
        const bool taken = view().SetMultiParameter(type, id, table.records());
        return (taken ? "taken " : "refused ") + support::resultText(table.records());
    }
    std::string content(int id) { return support::ticketText(engine.open(jobs, id)); }

    const std::shared_ptr<store::TicketStorage> keep;
    store::TicketContainer engine;
    MTICKET_ACCESS record;
};

/// An empty ticket 12 of a server, accessed through its container.
class TicketInside : public Server {
  public:
    static constexpr int id = 12;

    TicketInside() { create(id); }

    std::string send(const std::string& records) const { return Server::send(id, records); }
    std::string content() { return Server::content(id); }

    /// Calls with the view, followed by type and id.
    template<class Call>
    auto with(Call call) const {
        return call(view(), jobs, id);
    }
};

/// Applies sets and deletions in the notation of RecordTable. False at the first refusal.
inline bool edit(TICKET_UPDATE_LIST& list, int type, int id, const std::string& edits) {
    support::RecordTable table(edits);
    const SETMULTIPAR* r = table.records();
    while (r->key != nullptr &&
           list.xSetParameter(type, id, r->key, r->type, r->value, r->position, false)) {
        ++r;
    }
    return r->key == nullptr;
}
