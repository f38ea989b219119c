// SPDX-License-Identifier: Apache-2.0
#include "Shared-Components/Tintgate/NerovaKZComm/TicketSearch.h"

#include "ticket/TicketAccess.h"
#include "ticket/TicketViews.h"

namespace {

bool hasInteger(const STICKET_READ& ticket, const stSearchTickets& search) {
    const int value = *static_cast<const int*>(search.value);
    return search.inArray ? ticket.FindParameterPosition(search.key.c_str(), value) >= 0
                          : ticket.GetIntParameter(search.key.c_str(), 0) == value;
}

bool hasText(const STICKET_READ& ticket, const stSearchTickets& search) {
    const std::string value = static_cast<const char*>(search.value);
    return search.inArray ? ticket.FindParameterPosition(search.key.c_str(), value) >= 0
                          : ticket.GetStringParameter(search.key.c_str(), "") == value;
}

} // namespace

bool WalkGetTicketIds(void* context, int, int id, const STICKET_ACCESS*) {
    static_cast<std::vector<int>*>(context)->push_back(id);
    return true;
}

bool WalkSearchTicket(void* context, int, int id, const STICKET_ACCESS* ticket) {
    auto& search = *static_cast<stSearchKey*>(context);
    const auto& shown = ticket::as<STICKET_READ>(*ticket);
    if (shown.GetStringParameter(search.key.c_str(), "") != search.value) {
        return true;
    }
    search.ticketID = id;
    return false;
}

bool WalkSearchTickets(void* context, int, int id, const STICKET_ACCESS* ticket) {
    auto& search = *static_cast<stSearchTickets*>(context);
    const auto& shown = ticket::as<STICKET_READ>(*ticket);
    const bool integers = search.type == PARAM_INT;
    const bool matches = integers                      ? hasInteger(shown, search)
                         : search.type == PARAM_STRING ? hasText(shown, search)
                                                       : false;
    if (matches) {
        search.ids.push_back(id);
    }
    return integers;
}
