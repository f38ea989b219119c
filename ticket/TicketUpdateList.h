// SPDX-License-Identifier: Apache-2.0
// Changes to tickets, held back until a flush sends what differs to the server (C163).
#pragma once

#include <functional>
#include <map>
#include <set>
#include <string>
#include <vector>

#include <wx/thread.h>

#include "text/CharSetsWx.h"
#include "ticket/ParameterCaches.h"
#include "ticket/PartialMode.h"
#include "ticket/TicketContainer.h"
#include "ticket/TicketRecords.h"
#include "ticket/TicketUpdateCallback.h"
#include "ticket/TicketViews.h"

/// Tickets of this type live in lists only; they are never sent.
inline constexpr int TICKET_TYPE_LOCAL = 1000;

/// A ticket's address. The order is that of the types, then of the ids, so that within a type
/// virtual ids, being negative, come first.
struct TICKET_TYPE_ID {
    int type;
    int id;

    TICKET_TYPE_ID(int ticketType, int ticketId) : type(ticketType), id(ticketId) {}
    bool operator<(const TICKET_TYPE_ID& other) const {
        return type != other.type ? type < other.type : id < other.id;
    }
};

/// Pending changes of any number of tickets, readable as an overlay over the server's tickets.
///
/// A ticket that does not exist yet is addressed by a virtual id (NextTicketID), under its type or,
/// while that is unknown, under type -1: every operation files an invalid type with a virtual id
/// there. Reads take strings as the plug-in has them (UTF-8) into the user's encoding, sets the
/// other way.
///
/// A list belongs to one thread at a time. Values that reads hand out live as long as the list.
class TICKET_UPDATE_LIST {
  public:
    /// What is pending for one ticket.
    struct ENTRY {
        std::set<std::string> deletedKeys;      ///< Deleted, and not set again since.
        std::set<std::string> changedKeys;      ///< All that were touched, deleted ones included.
        const STICKET_ACCESS* ticket = nullptr; ///< The new values; a work ticket, owned.

        ENTRY() = default;
        /// Copies nothing, so that the work ticket has one owner only (C134).
        ENTRY(const ENTRY&) : ENTRY() {}
        ENTRY& operator=(const ENTRY&) = delete;
        ~ENTRY() { destruct(); }

        /// Gives the work ticket back.
        void destruct();
    };

    using TranslateFunction = int (*)(void* context, std::string& out, const char* in);
    using SetParamCallback =
        std::function<void(int type, int id, const char* key, PARAM_TYPE ptype, const void* value)>;

    /// The container gives original values; it may be null, and is not owned.
    explicit TICKET_UPDATE_LIST(const MTICKET_ACCESS* container) : m_container(container) {}
    TICKET_UPDATE_LIST(const TICKET_UPDATE_LIST&) = delete;
    TICKET_UPDATE_LIST& operator=(const TICKET_UPDATE_LIST&) = delete;

    /// -9999, -9998, ... -2000, and from the start again, even while an id is in use (C135).
    static int NextTicketID();

    /// The id that the last flush gave the virtual one; false, and -1, where it gave none.
    bool GetActualTicketID(int& real, int virtualId) const;

    /// True for a virtual id: -4, and -9999 to -2000.
    static bool TICKET_ID_Next(int id);

    /// True for an address that the list takes: a real id with a valid type or TICKET_TYPE_LOCAL,
    /// or a virtual id, for which an invalid type becomes -1.
    static bool TicketValid(int& type, int id);

    /// Sets a value, or deletes where the value is null, whatever the type. The first change of a
    /// single element of a real ticket takes the key's elements over from the server first.
    ///
    /// False for a text that can't be translated (nothing is stored, nobody told), an invalid
    /// address, a null key, and what the plug-in refuses. With broadcast the callback is told, also
    /// of what the plug-in refused (C140).
    bool xSetParameter(int type, int id, const char* key, PARAM_TYPE ptype, const void* value,
                       int position, bool broadcast);
    bool DelParameter(int type, int id, const char* key, int position, bool broadcast);
    /// Appends a text.
    bool AddParameter(int type, int id, const char* key, const std::string& value, bool broadcast);

    /// Replaces the key by these texts, and tells the callback once, with PARAM_COUNT and no value.
    /// V is std::vector<std::string>. Always true.
    template<class V>
    bool SetVectorParameter(int type, int id, const char* key, const V& texts);
    /// The same, with forward slashes.
    bool SetFilenameVectorParameter(int type, int id, const char* key,
                                    const std::vector<std::string>& names);

    /// True if there is a new element at position 0.
    bool ParameterExists(int type, int id, const char* key) const;
    /// True if the key was touched.
    bool ParameterChanged(int type, int id, const char* key) const;

    /// Reads from the overlay: 1, the list has the value and `out` is filled; 2, the key was
    /// deleted here; 0, the list has nothing on it, and the server's value counts.
    int xGetParameter(int type, int id, const char* key, PARAM_TYPE ptype, void* out, int position);

    /// As xGetParameter for a whole key, T int, double or std::string; but a deleted key gives 1,
    /// with `out` as it was (C136).
    template<class T>
    int xGetVectorParameter(int type, int id, const char* key, std::vector<T>& out) const;

    /// What deletions took away from the server's key, in the order of the deletions: integers,
    /// doubles and texts. 1 when something is kept for the ticket, be it not for this key.
    template<class T>
    int xGetDeletedVectorParameter(int type, int id, const char* key, std::vector<T>& out) const;

    /// Sets what a ticket holds, key by key as a walk shows it, telling the callback of each value:
    /// of the keys that a filter lets through, or all where there are no keys or the mode restricts
    /// nothing. A null ticket does nothing.
    void Merge(int type, int id, const STICKET_ACCESS* source, const char* const* keys);
    void Merge(int type, int id, const STICKET_ACCESS* source, const PARTIAL_MODE& mode);

    /// Sets one value of a walk; the context is a FULL_COLLECT_ACTION. Always true.
    static bool CollectAction(void* context, const char* key, PARAM_TYPE type, const void* value,
                              int position);

    /// Takes the place of an earlier callback. Always true.
    bool RegisterSetParamCallback(SetParamCallback callback);
    void BroadcastKeyChange(int type, int id, const char* key, PARAM_TYPE ptype, const void* value);

    /// True if nothing of the ticket was touched.
    bool IsEmpty(int type, int id) const;
    /// The touched keys of a ticket; false, and keys is as it was, when there are none.
    bool GetChangedKeysList(int type, int id, std::set<std::string>& keys);
    /// Appends the addresses of all tickets with an entry, ascending.
    void GetChangedTickets(std::vector<TICKET_TYPE_ID>& tickets);

    /// Forgets all changes. Virtual ids can still be translated.
    void Clear();
    /// Forgets one ticket. True if deleted values were kept for it; then whether the list counts as
    /// empty follows those of other tickets alone (C137).
    bool Clear(int type, int id);

    /// Sends all changes to a container, which need not be the list's own, and forgets them, also
    /// those that failed and those of TICKET_TYPE_LOCAL. Tickets with virtual ids are created
    /// first.
    ///
    /// True if a record of any ticket was accepted, and for a list without changes; false also when
    /// no ticket differs from the server's (C143). Without a container or a work ticket false, and
    /// the list stays as it is. Count, if not null, receives the number of records sent.
    bool FlushToContainer(const MTICKET_ACCESS* container, unsigned long* count,
                          const TICKET_UPDATE_CALLBACK& callback);
    /// The same for one ticket; type and id become those that it was sent to. TICKET_TYPE_LOCAL is
    /// true and stays in the list (C146).
    bool FlushToContainer(const MTICKET_ACCESS* container, int& type, int& id, unsigned long* count,
                          const TICKET_UPDATE_CALLBACK& callback);

    static int nextID;

    std::map<TICKET_TYPE_ID, ENTRY> m_changed;
    std::map<TICKET_TYPE_ID, ENTRY> m_toDelete; ///< Deleted values; the sets stay empty.
    std::map<int, int> m_idMap;                 ///< Virtual ids of the last flush.
    bool m_empty = true;                        ///< Nothing to flush.
    int m_defaultType = -1; ///< Of tickets without a valid type. Nothing sets it (C145).
    TranslateFunction m_translate = CharSetsWx::TulControls2IO; ///< Of texts that are set, or null.
    void* m_translateContext = CharSetsWx::Context;
    const MTICKET_ACCESS* m_container;
    void* m_reserved = nullptr;
    SetParamCallback m_setParamCallback;
    wxCriticalSection m_cacheLock; ///< Of m_stringCache.
    STRINGCACHE m_stringCache;     ///< Converted texts that were handed out.

  private:
    using ENTRIES = std::map<TICKET_TYPE_ID, ENTRY>;

    ENTRY* InsertMap(int type, int id);
    ENTRY* InsertToDeleteMap(int type, int id);
    const ENTRY* FindMap(int type, int id) const;
    const ENTRY* FindDeleteMap(int type, int id) const;
    bool EraseMap(int type, int id);
    bool EraseDeletedMap(int type, int id);

    void MergeAll(int type, int id, const STICKET_ACCESS* source);
    void MergeFiltered(int type, int id, const STICKET_ACCESS* source, const PARTIAL_MODE& mode);
    void KeepDeleted(const ENTRY& kept, int type, int id, const char* key, int position);
    void ConvertHandedOut(const char*& text);
    void OneFlushToContainer(const MTICKET_ADMIN& admin, unsigned long* count,
                             const TICKET_UPDATE_CALLBACK& callback, const STICKET_MODIFY& scratch,
                             int& type, int& id, const ENTRY& entry, bool& anyOk);
};

template<>
bool TICKET_UPDATE_LIST::SetVectorParameter(int type, int id, const char* key,
                                            const std::vector<std::string>& texts);

/// The context of a walk that sets everything in a list.
struct FULL_COLLECT_ACTION {
    TICKET_UPDATE_LIST* list;
    int type;
    int id;
};

/// The context of a walk that sets the keys of a mode in a list. Owns neither.
struct UPDATE_PARTIAL_COLLECT_ACTION {
    TICKET_UPDATE_LIST* list;
    int type;
    int id;
    const PARTIAL_MODE* mode;

    /// Sets the value if the mode has the key; no mode has a null key. True unless the list refuses
    /// the value.
    bool SetParameter(const char* key, PARAM_TYPE ptype, const void* value, int position);

    /// As TICKET_UPDATE_LIST::CollectAction; the context is the action.
    static bool CollectAction(void* context, const char* key, PARAM_TYPE type, const void* value,
                              int position);
};
