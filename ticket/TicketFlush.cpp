// SPDX-License-Identifier: Apache-2.0
// The flush of a TICKET_UPDATE_LIST. For each ticket, compares what the server has with what it
// should have, and sends the difference as one table.
#include "ticket/ParameterList.h"
#include "ticket/ParameterTables.h"
#include "ticket/TicketAccess.h"
#include "ticket/TicketDifference.h"
#include "ticket/TicketFactory.h"
#include "ticket/TicketUpdateList.h"
#include "ticket/TicketUpdateLog.h"

namespace {

constexpr const char* const* allKeys = nullptr;

/// A work ticket for one flush.
class Scratch {
  public:
    Scratch() : m_ticket(CreateTicket(nullptr)) {}
    ~Scratch() {
        if (m_ticket != nullptr) {
            DestroyTicket(m_ticket);
        }
    }
    Scratch(const Scratch&) = delete;
    Scratch& operator=(const Scratch&) = delete;

    explicit operator bool() const { return m_ticket != nullptr; }
    const STICKET_MODIFY& view() const { return ticket::as<STICKET_MODIFY>(*m_ticket); }

  private:
    const STICKET_ACCESS* m_ticket;
};

/// The list's table, or an empty table if the list has none.
const SETMULTIPAR* tableOf(SETMULTIPAR_LIST& list) {
    static constexpr SETMULTIPAR nothing{};
    const SETMULTIPAR* table = list.Table(false);
    return table != nullptr ? table : &nothing;
}

} // namespace

bool TICKET_UPDATE_LIST::FlushToContainer(const MTICKET_ACCESS* container, unsigned long* count,
                                          const TICKET_UPDATE_CALLBACK& callback) {
    m_idMap.clear();
    if (count != nullptr) {
        *count = 0;
    }
    if (container == nullptr) {
        return false;
    }
    if (m_empty) {
        return true;
    }
    bool anyOk = false;
    {
        const Scratch scratch;
        if (!scratch) {
            return false;
        }
        for (const auto& [address, entry] : m_changed) {
            if (address.type == TICKET_TYPE_LOCAL) {
                continue;
            }
            int type = address.type;
            int id = address.id;
            OneFlushToContainer(ticket::as<MTICKET_ADMIN>(*container), count, callback,
                                scratch.view(), type, id, entry, anyOk);
        }
    }
    Clear(); // Failed changes are discarded too and not retried (C142).
    return anyOk;
}

bool TICKET_UPDATE_LIST::FlushToContainer(const MTICKET_ACCESS* container, int& type, int& id,
                                          unsigned long* count,
                                          const TICKET_UPDATE_CALLBACK& callback) {
    const TICKET_TYPE_ID asked(type, id);
    m_idMap.erase(id);
    if (count != nullptr) {
        *count = 0;
    }
    if (type == TICKET_TYPE_LOCAL) {
        return true;
    }
    if (!TicketValid(type, id) || container == nullptr) {
        return false;
    }
    if (m_empty) {
        return true;
    }
    bool anyOk = false;
    {
        const Scratch scratch;
        if (!scratch) {
            return false;
        }
        if (const auto found = m_changed.find(TICKET_TYPE_ID(type, id)); found != m_changed.end()) {
            OneFlushToContainer(ticket::as<MTICKET_ADMIN>(*container), count, callback,
                                scratch.view(), type, id, found->second, anyOk);
        }
    }
    Clear(asked.type, asked.id);
    return anyOk;
}

void TICKET_UPDATE_LIST::OneFlushToContainer(const MTICKET_ADMIN& admin, unsigned long* count,
                                             const TICKET_UPDATE_CALLBACK& callback,
                                             const STICKET_MODIFY& scratch, int& type, int& id,
                                             const ENTRY& entry, bool& anyOk) {
    clTICKET_UPDATE_LOG log(ticket::updateLogName);
    log.printf("FlushToContainer() (%d, %d)", type, id);
    if (!TICKET_TYPE_Valid(type)) {
        const int from = type;
        type = m_defaultType;
        callback(false, from, type);
        log.printf(" ticketType=%d", type);
        if (!TICKET_TYPE_Valid(type)) {
            log.printf(" INVALID\n");
            return;
        }
    }
    if (TICKET_ID_Next(id)) {
        const int from = id;
        id = admin.CreateNextTicket(type, true);
        m_idMap[from] = id;
        callback(true, from, id);
        log.printf(" ticketID=%d", id);
    }
    if (!TICKET_ID_Valid(id)) {
        log.printf(" INVALID\n");
        return;
    }

    // If no key was deleted, the second set empties the mode, so the whole ticket is copied.
    // Unchanged binary values and NaNs are then sent again (C144).
    PARTIAL_MODE mode;
    mode.set(entry.changedKeys, false);
    mode.set(entry.deletedKeys, false);
    scratch.Assign(admin.OpenTicket(type, id), PARTIAL_TABLE(mode));

    // Deep, because the scratch ticket changes before the comparison.
    SETMULTIPAR_LIST present(true);
    present.Merge(&scratch, allKeys);
    for (const std::string& key : entry.deletedKeys) {
        scratch.DelParameter(key.c_str(), POSITION_WHOLE);
    }
    scratch.Merge(entry.ticket, allKeys);
    SETMULTIPAR_LIST wanted(true);
    wanted.Merge(&scratch, allKeys);

    std::vector<SETMULTIPAR> table = ticket::difference(tableOf(present), tableOf(wanted));
    if (table.empty()) {
        log.printf(" UNCHANGED\n");
        return;
    }
    if (count != nullptr) {
        *count += table.size();
    }
    table.emplace_back();
    if (!admin.SetMultiParameter(type, id, table.data())) {
        log.printf(" FAILED\n");
    } else if (!AnyMultiParameterOk(table.data())) {
        log.printf(" FAILED PARAMETERS\n");
    } else {
        log.printf(" OK\n");
        anyOk = true;
    }
}
