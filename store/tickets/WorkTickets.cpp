// SPDX-License-Identifier: Apache-2.0
#include "store/tickets/WorkTickets.h"

#include <unordered_map>

#include "store/tickets/TicketRecord.h"

namespace store {

namespace {

/// Never destroyed: tickets may be returned, and texts read, while the process ends.
HandedOut& handedOut() {
    static auto& all = *new HandedOut;
    return all;
}

class WorkTicket : public Ticket {
  public:
    bool get(const char* key, PARAM_TYPE type, void* out, int position) override {
        return readElement(m_content->find(key).get(), type, out, position, handedOut());
    }

    std::shared_ptr<const TicketContent> content(const KeyFilter& filter) override {
        if (filter.all()) {
            return m_content;
        }
        return std::make_shared<TicketContent>(m_content->select(filter));
    }

    /// A change does not affect the returned content: see own().
    std::shared_ptr<const TicketContent> shown() override { return m_content; }

    bool apply(SETMULTIPAR* table) override {
        own(m_content).apply(table);
        return true;
    }

    bool transfer(const TicketContent& source, bool replace) override {
        own(m_content).transfer(source, replace);
        return true;
    }

    bool whoAmI(STICKET_OPTION_WHOAMI&) override { return false; }

  private:
    std::shared_ptr<TicketContent> m_content = std::make_shared<TicketContent>();
};

using WorkTickets = std::unordered_map<const STICKET_ACCESS*, std::unique_ptr<TicketRecord>>;

/// Lives as long as the texts.
WorkTickets& workTickets() {
    static auto& all = *new WorkTickets;
    return all;
}

const STICKET_ACCESS* create(const char*) {
    const STICKET_ACCESS* access = nullptr;
    guarded([&] {
        auto record = std::make_unique<TicketRecord>(std::make_shared<WorkTicket>());
        access = workTickets().emplace(record->access(), std::move(record)).first->first;
        return true;
    });
    return access;
}

void destroy(const STICKET_ACCESS** ticket) {
    if (ticket != nullptr && workTickets().erase(*ticket) != 0) {
        *ticket = nullptr;
    }
}

} // namespace

const ticket::Factory* ticketFactory() {
    static const ticket::Factory made = [] {
        ticket::Factory factory{};
        ticket::factory::Create::put(factory, create);
        ticket::factory::Destroy::put(factory, destroy);
        return factory;
    }();
    return &made;
}

} // namespace store
