// SPDX-License-Identifier: Apache-2.0
// Collects changes to tickets until a flush sends the differences to the server (C163).
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

/// Tickets of this type exist in lists only and are never sent.
inline constexpr int TICKET_TYPE_LOCAL = 1000;

/// A ticket's address, ordered by type, then by id. Virtual ids are negative, so within a type they
/// come first.
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
/// A ticket that does not exist yet is addressed by a virtual id (NextTicketID) and its type, or
/// type -1 if that is unknown: with a virtual id, every operation treats an invalid type as -1.
/// Reads convert strings from the plug-in's UTF-8 to the user's encoding, and sets convert them
/// back.
///
/// A list must be used by one thread at a time. Values returned by reads live as long as the list.
class TICKET_UPDATE_LIST {
  public:
    /// The pending changes of one ticket.
    struct ENTRY {
        std::set<std::string> deletedKeys;      ///< Deleted, and not set again since.
        std::set<std::string> changedKeys;      ///< All changed keys, including deleted ones.
        const STICKET_ACCESS* ticket = nullptr; ///< The new values, in an owned work ticket.

        ENTRY() = default;
        /// Copies nothing, so that the work ticket has a single owner (C134).
        ENTRY(const ENTRY&) : ENTRY() {}
        ENTRY& operator=(const ENTRY&) = delete;
        ~ENTRY() { destruct(); }

        /// Releases the work ticket.
        void destruct();
    };

    using TranslateFunction = int (*)(void* context, std::string& out, const char* in);
    using SetParamCallback =
        std::function<void(int type, int id, const char* key, PARAM_TYPE ptype, const void* value)>;

    /// The container supplies original values. It may be null and is not owned.
    explicit TICKET_UPDATE_LIST(const MTICKET_ACCESS* container) : m_container(container) {}
    TICKET_UPDATE_LIST(const TICKET_UPDATE_LIST&) = delete;
    TICKET_UPDATE_LIST& operator=(const TICKET_UPDATE_LIST&) = delete;

    /// Returns -9999, -9998, ... -2000, then starts over, even if an id is still in use (C135).
    static int NextTicketID();

    /// The real id that the last flush assigned to the virtual one. If none, false and -1.
    bool GetActualTicketID(int& real, int virtualId) const;

    /// True for a virtual id: -4, or -9999 to -2000.
    static bool TICKET_ID_Next(int id);

    /// True for an address that the list accepts: a real id with a valid type or TICKET_TYPE_LOCAL,
    /// or a virtual id. For a virtual id, an invalid type is set to -1.
    static bool TicketValid(int& type, int id);

    /// Sets a value, or deletes it if `value` is null, whatever the type. The first change of a
    /// single element of a real ticket copies the key's elements from the server first.
    ///
    /// False if a text can't be translated (nothing is stored or reported), the address is invalid,
    /// the key is null, or the plug-in refuses. With broadcast, the callback is called even if the
    /// plug-in refuses (C140).
    bool xSetParameter(int type, int id, const char* key, PARAM_TYPE ptype, const void* value,
                       int position, bool broadcast);
    bool DelParameter(int type, int id, const char* key, int position, bool broadcast);
    /// Appends a text.
    bool AddParameter(int type, int id, const char* key, const std::string& value, bool broadcast);

    /// Replaces the key by these texts and calls the callback once, with PARAM_COUNT and no value.
    /// V is std::vector<std::string>. Always true.
    template<class V>
    bool SetVectorParameter(int type, int id, const char* key, const V& texts);
    /// Same, with backslashes converted to forward slashes.
    bool SetFilenameVectorParameter(int type, int id, const char* key,
                                    const std::vector<std::string>& names);

    /// True if the list has an element for the key at position 0.
    bool ParameterExists(int type, int id, const char* key) const;
    /// True if the key was changed.
    bool ParameterChanged(int type, int id, const char* key) const;

    /// Reads from the overlay. 1: the list has the value, and `out` is filled. 2: the key was
    /// deleted here. 0: the list has no value, use the server's.
    int xGetParameter(int type, int id, const char* key, PARAM_TYPE ptype, void* out, int position);

    /// Same for a whole key; T is int, double or std::string. But a deleted key returns 1 and
    /// leaves `out` unchanged (C136).
    template<class T>
    int xGetVectorParameter(int type, int id, const char* key, std::vector<T>& out) const;

    /// The values that deletions removed from the server's key, in order of deletion: integers,
    /// doubles and texts. Returns 1 if deleted values of any key are kept for the ticket.
    template<class T>
    int xGetDeletedVectorParameter(int type, int id, const char* key, std::vector<T>& out) const;

    /// Sets the values of a ticket in the order of a walk and calls the callback for each. Only
    /// keys that pass the filter are set; all pass if there are no keys or if the mode restricts
    /// nothing. A null ticket sets nothing.
    void Merge(int type, int id, const STICKET_ACCESS* source, const char* const* keys);
    void Merge(int type, int id, const STICKET_ACCESS* source, const PARTIAL_MODE& mode);

    /// Sets one value of a walk. The context is a FULL_COLLECT_ACTION. Always true.
    static bool CollectAction(void* context, const char* key, PARAM_TYPE type, const void* value,
                              int position);

    /// Replaces any earlier callback. Always true.
    bool RegisterSetParamCallback(SetParamCallback callback);
    void BroadcastKeyChange(int type, int id, const char* key, PARAM_TYPE ptype, const void* value);

    /// True if no key of the ticket was changed.
    bool IsEmpty(int type, int id) const;
    /// The changed keys of a ticket. If there are none, returns false and leaves `keys` unchanged.
    bool GetChangedKeysList(int type, int id, std::set<std::string>& keys);
    /// Appends the addresses of all changed tickets, ascending.
    void GetChangedTickets(std::vector<TICKET_TYPE_ID>& tickets);

    /// Discards all changes. Virtual ids can still be translated.
    void Clear();
    /// Discards one ticket's changes. True if deleted values were kept for it. In that case, only
    /// the deleted values kept for other tickets decide whether the list counts as empty (C137).
    bool Clear(int type, int id);

    /// Sends all changes to a container, which may differ from the list's own, and then discards
    /// them, including failed ones and those of TICKET_TYPE_LOCAL. Tickets with virtual ids are
    /// created first.
    ///
    /// True if any record was accepted or if the list has no changes. False if no ticket differs
    /// from the server's (C143). Without a container or a work ticket, returns false and keeps the
    /// list. `count`, if not null, receives the number of records sent.
    bool FlushToContainer(const MTICKET_ACCESS* container, unsigned long* count,
                          const TICKET_UPDATE_CALLBACK& callback);
    /// Same for one ticket; type and id become the ones it was sent to. For TICKET_TYPE_LOCAL,
    /// returns true and keeps the ticket in the list (C146).
    bool FlushToContainer(const MTICKET_ACCESS* container, int& type, int& id, unsigned long* count,
                          const TICKET_UPDATE_CALLBACK& callback);

    static int nextID;

    std::map<TICKET_TYPE_ID, ENTRY> m_changed;
    std::map<TICKET_TYPE_ID, ENTRY> m_toDelete; ///< Deleted values; the key sets stay empty.
    std::map<int, int> m_idMap;                 ///< Virtual to real ids of the last flush.
    bool m_empty = true;                        ///< Nothing to flush.
    int m_defaultType = -1; ///< For tickets without a valid type. Never set (C145).
    TranslateFunction m_translate = CharSetsWx::TulControls2IO; ///< For texts to set; may be null.
    void* m_translateContext = CharSetsWx::Context;
    const MTICKET_ACCESS* m_container;
    void* m_reserved = nullptr;
    SetParamCallback m_setParamCallback;
    wxCriticalSection m_cacheLock; ///< Guards m_stringCache.
    STRINGCACHE m_stringCache;     ///< Converted texts returned to callers.

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

/// The context of a walk that sets the keys of a mode in a list. Owns neither of them.
struct UPDATE_PARTIAL_COLLECT_ACTION {
    TICKET_UPDATE_LIST* list;
    int type;
    int id;
    const PARTIAL_MODE* mode;

    /// Sets the value if the mode contains the key; a null key never matches. False only if the
    /// list refuses the value.
    bool SetParameter(const char* key, PARAM_TYPE ptype, const void* value, int position);

    /// Like TICKET_UPDATE_LIST::CollectAction, with the action as context.
    static bool CollectAction(void* context, const char* key, PARAM_TYPE type, const void* value,
                              int position);
};
