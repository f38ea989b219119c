// SPDX-License-Identifier: Apache-2.0
#include "ticket/TicketFactory.h"

const ticket::Factory* hSTicketInstance = nullptr;

const STICKET_ACCESS* CreateTicket(const char* name) {
    return hSTicketInstance == nullptr ? nullptr
                                       : ticket::factory::Create::of(*hSTicketInstance)(name);
}

void DestroyTicket(const STICKET_ACCESS*& access) {
    if (hSTicketInstance != nullptr) {
        ticket::factory::Destroy::of (*hSTicketInstance)(&access);
    }
}
