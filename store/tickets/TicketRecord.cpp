// SPDX-License-Identifier: Apache-2.0
#include "store/tickets/TicketRecord.h"

#include <unordered_map>

namespace store {

namespace {

using Tickets = std::unordered_map<const void*, std::shared_ptr<Ticket>>;

/// Tickets by the address of their records. Never destroyed, because tickets may be returned while
/// the process ends.
Tickets& tickets() {
    static auto& all = *new Tickets;
    return all;
}

/// Runs a function of the record on the ticket; false for an unknown handle.
template<class Body>
int on(void* handle, Body body) {
    return guarded([&] {
        const auto ticket = findTicket(handle);
        return ticket != nullptr && body(*ticket);
    });
}

int getParameter(void* handle, const char* key, PARAM_TYPE type, void* out, int position) {
    return on(handle, [&](Ticket& ticket) {
        return key != nullptr && ticket.get(key, type, out, position);
    });
}

int getMultiParameter(void* handle, GETMULTIPAR* table) {
    const auto ticket = findTicket(handle);
    getMultiple(table, [&](const char* key, PARAM_TYPE type, void* out, int position) {
        return ticket != nullptr && ticket->get(key, type, out, position);
    });
    return ticket != nullptr && table != nullptr;
}

int walk(void* handle, SCollect callback, void* context, const char*, int) {
    return on(handle, [&](Ticket& ticket) {
        const auto content = callback == nullptr ? nullptr : ticket.shown();
        if (content == nullptr) {
            return false;
        }
        content->walk(callback, context);
        return true;
    });
}

int setParameter(void* handle, const char* key, PARAM_TYPE type, const void* value, int position) {
    return on(handle, [&](Ticket& ticket) {
        return setSingle(key, type, value, position,
                         [&](SETMULTIPAR* table) { return ticket.apply(table); });
    });
}

int setMultiParameter(void* handle, SETMULTIPAR* table) {
    return guarded([&] {
        return setMultiple(table, [&](SETMULTIPAR* records) {
            const auto ticket = findTicket(handle);
            return ticket != nullptr && ticket->apply(records);
        });
    });
}

/// A replacing transfer without a source still empties the ticket, and fails.
int transfer(void* handle, const STICKET_ACCESS* source, const char* const* keys, int replace) {
    return on(handle, [&](Ticket& ticket) {
        const auto from = findTicket(source);
        const auto content = from == nullptr ? nullptr : from->content(KeyFilter(keys));
        if (content != nullptr) {
            return ticket.transfer(*content, ticket::bit0(replace));
        }
        if (ticket::bit0(replace)) {
            ticket.transfer(TicketContent(), true);
        }
        return false;
    });
}

int option(void* handle, int code, void* record) {
    return on(handle, [&](Ticket& ticket) {
        return code == STICKET_OPTION_CODE_WHOAMI && record != nullptr &&
               ticket.whoAmI(*static_cast<STICKET_OPTION_WHOAMI*>(record));
    });
}

} // namespace

std::shared_ptr<Ticket> findTicket(const void* record) {
    const auto found = tickets().find(record);
    return found == tickets().end() ? nullptr : found->second;
}

TicketRecord::TicketRecord(std::shared_ptr<Ticket> ticket) {
    namespace single = ::ticket::single;
    m_access.words[::ticket::handleWord] = reinterpret_cast<std::uint64_t>(&m_access);
    single::GetParameter::put(m_access, getParameter);
    single::GetMultiParameter::put(m_access, getMultiParameter);
    single::Walk::put(m_access, walk);
    single::SetParameter::put(m_access, setParameter);
    single::SetMultiParameter::put(m_access, setMultiParameter);
    single::Transfer::put(m_access, transfer);
    single::Option::put(m_access, option);
    tickets().emplace(&m_access, std::move(ticket));
}

TicketRecord::~TicketRecord() {
    tickets().erase(&m_access);
}

} // namespace store
