// SPDX-License-Identifier: Apache-2.0
// The tickets of a server, as seen by one session.
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

/// A container and its record of functions. It exists until the end of the session, and so do the
/// record, the tickets that it opened and the texts read from them. An opened ticket keeps one
/// record even after the ticket is deleted; then it reads as empty.
///
/// Other processes may change the tickets meanwhile. Reads of a count or of position -1 or 0, and
/// the first read of another key, see the current state. Further elements of that key are from the
/// same moment, so an array is consistent and fetched once.
class TicketContainer {
  public:
    explicit TicketContainer(std::shared_ptr<TicketStorage> keep);
    ~TicketContainer();
    TicketContainer(const TicketContainer&) = delete;
    TicketContainer& operator=(const TicketContainer&) = delete;

    const MTICKET_ACCESS* access() const { return &m_access; }

    bool exists(int type, int id);
    /// The ticket's record, owned by the container. Null if there is no such ticket.
    const STICKET_ACCESS* open(int type, int id);
    const STICKET_ACCESS* createWithKeys(int type, int id, const char* const* keys);
    /// Returns the new id, or -1.
    int createNext(int type);
    bool remove(int type, int id);
    /// Calls back with the existing tickets of a type, by ascending id. False for an invalid type.
    bool walkTickets(TicketWalk callback, void* context, int type);

    // Like the functions of Ticket.
    bool get(int type, int id, const char* key, PARAM_TYPE ptype, void* out, int position);
    std::shared_ptr<const TicketContent> content(int type, int id, const KeyFilter& filter);
    std::shared_ptr<const TicketContent> shown(int type, int id);
    bool apply(int type, int id, SETMULTIPAR* table);
    bool transfer(int type, int id, const TicketContent& source, bool replace);

    /// The keys of a ticket that interest the client. Only a hint that hides nothing. Null or an
    /// empty table clears it. False if there is no such ticket.
    bool setPartial(int type, int id, const char* const* keys);
    /// Empty if nothing is set.
    std::vector<std::string> partial(int type, int id) const;

    /// Enables notifications (possibly again, with other keys) or disables them. The id is a
    /// ticket's id, TICKET_ID_NEW or TICKET_ID_NEW_PLAIN; or TICKET_ID_ALL, which disables every id
    /// of the type. False for any other address.
    bool notify(int type, int id, int notificationId, bool enable, const char* const* keys);

    struct Notification {
        int type;
        int id;
        int notificationId;
        std::vector<std::string> keys; ///< Empty means all keys.
        bool operator==(const Notification&) const = default;
    };
    std::vector<Notification> notifications() const;

  private:
    class OpenedTicket;
    using Address = std::pair<int, int>;

    /// The key read last.
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
    /// The contents that walks have shown, kept until this session changes their tickets. A ticket
    /// has more than one only if others changed it between two walks.
    std::map<Address, Shown> m_shown;
    std::map<Address, std::vector<std::string>> m_partial;
    std::map<std::tuple<int, int, int>, std::vector<std::string>> m_notifications;
};

} // namespace store
