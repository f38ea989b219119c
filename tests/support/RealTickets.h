// Tickets of the real engine, for tests: records are copied, so that a test can replace single
// words.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "comgui/MemoryKeep.h"
#include "comgui/TicketContainer.h"
#include "comgui/WorkTickets.h"
#include "ticket/SingleTicket.h"
#include "ticket/TicketContainer.h"
#include "ticket/TicketFactory.h"

/// A work ticket, addressed by its own record.
class WorkTicket {
  public:
    WorkTicket() {
        hSTicketInstance = store::ticketFactory();
        m_real = CreateTicket(nullptr);
        record = *m_real;
    }
    ~WorkTicket() { DestroyTicket(m_real); }
    WorkTicket(const WorkTicket&) = delete;
    WorkTicket& operator=(const WorkTicket&) = delete;

    const STICKET_MODIFY& view() const { return ticket::as<STICKET_MODIFY>(record); }
    /// The engine's own record, which is what a transfer takes as a source.
    const STICKET_ACCESS* real() const { return m_real; }

    template<class Call>
    auto with(Call call) const {
        return call(view());
    }

    STICKET_ACCESS record;

  private:
    const STICKET_ACCESS* m_real;
};

/// A container with an empty ticket 12 of type 3, addressed through the container.
class TicketInside {
  public:
    static constexpr int type = 3;
    static constexpr int id = 12;

    TicketInside() : engine(std::make_shared<store::MemoryKeep>()), record(*engine.access()) {
        engine.createWithKeys(type, id, nullptr);
    }

    const MTICKET_ADMIN& view() const { return ticket::as<MTICKET_ADMIN>(record); }

    /// Calls with the view, and type and id behind it.
    template<class Call>
    auto with(Call call) const {
        return call(view(), type, id);
    }

    store::TicketContainer engine;
    MTICKET_ACCESS record;
};
