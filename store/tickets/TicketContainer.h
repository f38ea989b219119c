// SPDX-License-Identifier: Apache-2.0
// The tickets of a server, as one session reaches them.
#pragma once

#include <map>
#include <memory>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "store/tickets/TicketRecord.h"
#include "store/tickets/TicketStorage.h"
#include "ticket/TicketRecords.h"

namespace store {

/// A container behind its record of functions. It ends with the session: the record, the tickets
/// that it opened and the texts that were read from them are good until then. A ticket that was
/// opened is one record for good, also when the ticket itself is deleted: it then reads as empty.
///
/// Other processes may change the tickets meanwhile. A count, position -1 or 0, and the first read
/// of another key see what is there now; further elements of that key come from the same moment, so
/// that an array is whole and is fetched once.
class TicketContainer {
  public:
    explicit TicketContainer(std::shared_ptr<TicketStorage> keep);
    ~TicketContainer();
    TicketContainer(const TicketContainer&) = delete;
    TicketContainer& operator=(const TicketContainer&) = delete;

    const MTICKET_ACCESS* access() const { return &m_access; }

    bool exists(int type, int id);
    /// The ticket's record, which belongs to the container; null when there is no such ticket.
    const STICKET_ACCESS* open(int type, int id);
    const STICKET_ACCESS* createWithKeys(int type, int id, const char* const* keys);
    /// The new id, or -1.
    int createNext(int type);
    bool remove(int type, int id);
    /// Shows the tickets of a type that are there now, by ascending id. False for an invalid type.
    bool walkTickets(TicketWalk callback, void* context, int type);

    // As the functions of Ticket.
    bool get(int type, int id, const char* key, PARAM_TYPE ptype, void* out, int position);
    std::shared_ptr<const TicketContent> content(int type, int id, const KeyFilter& filter);
    std::shared_ptr<const TicketContent> shown(int type, int id);
    bool apply(int type, int id, SETMULTIPAR* table);
    bool transfer(int type, int id, const TicketContent& source, bool replace);

    /// Which keys of a ticket are of interest to the client. It is a hint and hides nothing. Null
    /// or an empty table forgets it. False when there is no such ticket.
    bool setPartial(int type, int id, const char* const* keys);
    /// Empty when nothing is set.
    std::vector<std::string> partial(int type, int id) const;

    /// Enables (again, with other keys) or disables notifications. The id is a ticket's,
    /// TICKET_ID_NEW or TICKET_ID_NEW_PLAIN, or TICKET_ID_ALL, which disables every id of the type.
    /// False for any other address.
    bool notify(int type, int id, int notificationId, bool enable, const char* const* keys);

    struct Notification {
        int type;
        int id;
        int notificationId;
        std::vector<std::string> keys; ///< Empty: all keys.
        bool operator==(const Notification&) const = default;
    };
    std::vector<Notification> notifications() const;

  private:
    class OpenedTicket;
    using Address = std::pair<int, int>;

    /// The last key that was read.
    struct Snapshot {
        bool held = false;
        Address address;
        std::string key;
        std::shared_ptr<const Elements> elements;
    };

    using Shown = std::vector<std::shared_ptr<const TicketContent>>;

    void dropSnapshot();
    template<class Change>
    bool change(int type, int id, Change change);
    bool fetchAndGet(int type, int id, const char* key, PARAM_TYPE ptype, void* out, int position);

    const std::shared_ptr<TicketStorage> m_storage;
    MTICKET_ACCESS m_access{};
    HandedOut m_handedOut;
    Snapshot m_snapshot;
    std::map<Address, std::unique_ptr<TicketRecord>> m_opened;
    /// The different contents that walks showed, until their tickets change by this session. There
    /// is more than one of a ticket only if others changed it between two walks.
    std::map<Address, Shown> m_shown;
    std::map<Address, std::vector<std::string>> m_partial;
    std::map<std::tuple<int, int, int>, std::vector<std::string>> m_notifications;
};

} // namespace store
