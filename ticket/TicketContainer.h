// SPDX-License-Identifier: Apache-2.0
// Views of the container of a session: its tickets and their parameters (C161).
#pragma once

#include <string>
#include <vector>

#include "ticket/TicketFamilies.h"

/// Read access. The view has no data: it is the plug-in's record, at the same address (ticket::as).
/// The plug-in owns the container and the tickets that it opens.
///
/// A ticket is addressed by its type and id. Unless documented otherwise, they reach the plug-in
/// unchecked. Parameters are read as in STICKET_READ.
class MTICKET_READ : public MTICKET_ACCESS {
  public:
    bool TicketExists(int type, int id) const;

    /// The ticket, or null.
    const STICKET_ACCESS* OpenTicket(int type, int id) const;

    /// The ids of all tickets of a type, in the plug-in's order. True if there are any. An invalid
    /// type has none, and the plug-in is not called.
    bool GetTickets(int type, std::vector<int>& ids) const;

    bool WalkTickets(TicketWalk fn, void* context, int type) const;

    bool GetParameter(int type, int id, const char* key, std::string& out, int position) const;

    int GetIntParameter(int type, int id, const char* key, int fallback) const;
    /// Note that the position precedes the key (C128).
    int GetIntParameter(int type, int id, int position, const char* key, int fallback) const;

    std::string GetStringParameter(int type, int id, const char* key,
                                   const std::string& fallback) const;
    /// The plug-in's own text (not a copy), or the fallback.
    const char* GetPszParameter(int type, int id, const char* key, const char* fallback) const;

    bool GetFilenameParameterChk_C(int type, int id, const char* key, std::string& out,
                                   int position) const;

    template<class T>
    bool GetVectorParameter(int type, int id, const char* key, std::vector<T>& out) const {
        return ticket::readVector(ticket::Contained(*this, type, id), key, out);
    }

    bool GetFilenameVectorParameter_C(int type, int id, const char* key,
                                      std::vector<std::string>& out) const;

    template<class T>
    bool GetArrayParameter(int type, int id, const char* key, T* out, unsigned long count) const {
        return ticket::readArray(ticket::Contained(*this, type, id), key, out, count);
    }
};

/// Write access to parameters, as in STICKET_MODIFY.
class MTICKET_MODIFY : public MTICKET_READ {
  public:
    bool DelParameter(int type, int id, const char* key, int position) const;
    bool SetMultiParameter(int type, int id, SETMULTIPAR* table) const;

    template<class T>
    bool SetVectorParameter(int type, int id, const char* key, const std::vector<T>& values) const {
        return ticket::writeVector(ticket::Contained(*this, type, id), key, values);
    }

    bool SetFilenameVectorParameter(int type, int id, const char* key,
                                    const std::vector<std::string>& names) const;

    template<class T>
    bool SetArrayParameter(int type, int id, const char* key, const T* values,
                           unsigned long count) const {
        return ticket::writeArray(ticket::Contained(*this, type, id), key, values, count);
    }

    /// Passes the ticket's table of partial keys to the plug-in.
    bool SetPartial(int type, int id, const char* const* keys) const;
};

/// Creates and deletes tickets and controls change notifications.
class MTICKET_ADMIN : public MTICKET_MODIFY {
  public:
    /// Returns the new id, or -1. The flag selects TICKET_ID_NEW over TICKET_ID_NEW_PLAIN.
    int CreateNextTicket(int type, bool flag) const;

    /// Returns the ticket, and creates it with these keys if it does not exist. Returns null if it
    /// can't be created or if the plug-in has no function for that.
    const STICKET_ACCESS* CreateOrOpenTicket(int type, int id, const char* const* keys) const;

    /// Only the plug-in interprets the flag.
    bool DeleteTicket(int type, int id, bool flag) const;

    bool EnableNotification(int type, int id, int notificationId, const char* const* keys) const;
    bool DisableNotification(int type, int id, int notificationId) const;
};
