// SPDX-License-Identifier: Apache-2.0
// Views on the container of a session: the parameters of its tickets, and the tickets (C161).
#pragma once

#include <string>
#include <vector>

#include "ticket/TicketFamilies.h"

/// Reading. The view is the plug-in's record itself, at the same address (ticket::as), and has no
/// data; the container and the tickets that it opens belong to the plug-in.
///
/// A ticket is addressed by its type and its id, which reach the plug-in unchecked except where
/// told. Parameters are read as by STICKET_READ.
class MTICKET_READ : public MTICKET_ACCESS {
  public:
    bool TicketExists(int type, int id) const;

    /// The ticket, or null.
    const STICKET_ACCESS* OpenTicket(int type, int id) const;

    /// The ids of all tickets of a type, as the plug-in walks them. True when there are any; an
    /// invalid type has none, and the plug-in is not asked.
    bool GetTickets(int type, std::vector<int>& ids) const;

    bool WalkTickets(TicketWalk fn, void* context, int type) const;

    bool GetParameter(int type, int id, const char* key, std::string& out, int position) const;

    int GetIntParameter(int type, int id, const char* key, int fallback) const;
    /// Note the position in front of the key (C128).
    int GetIntParameter(int type, int id, int position, const char* key, int fallback) const;

    std::string GetStringParameter(int type, int id, const char* key,
                                   const std::string& fallback) const;
    /// The plug-in's own text, or the fallback.
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

/// Changing parameters, as STICKET_MODIFY does.
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

    /// Gives the plug-in the ticket's table of partial keys.
    bool SetPartial(int type, int id, const char* const* keys) const;
};

/// Making and removing tickets, and being told of changes.
class MTICKET_ADMIN : public MTICKET_MODIFY {
  public:
    /// The new ticket's id, or -1. The flag chooses TICKET_ID_NEW over TICKET_ID_NEW_PLAIN.
    int CreateNextTicket(int type, bool flag) const;

    /// The ticket, made with these keys if it is not there. Null where it can't be made, also where
    /// the plug-in has no function for that.
    const STICKET_ACCESS* CreateOrOpenTicket(int type, int id, const char* const* keys) const;

    /// The flag means something to the plug-in alone.
    bool DeleteTicket(int type, int id, bool flag) const;

    bool EnableNotification(int type, int id, int notificationId, const char* const* keys) const;
    bool DisableNotification(int type, int id, int notificationId) const;
};
