// SPDX-License-Identifier: Apache-2.0
// Views of one ticket's record, which add what the plug-in does not offer: strings, vectors,
// arrays, booleans and file names.
#pragma once

#include <string>
#include <vector>

#include "ticket/TicketFamilies.h"

/// Read access. The view has no data: it is the plug-in's record, at the same address (ticket::as).
/// A failure returns false without a reason. Positions are POSITION_WHOLE or an element.
class STICKET_READ : public STICKET_ACCESS {
  public:
    bool ParameterExists(const char* key, int position) const;

    /// Empties `out` on failure.
    bool GetParameter(const char* key, std::string& out, int position) const;
    /// Leaves `out` unchanged on failure.
    bool GetParameter(const char* key, int& out, int position) const;

    int GetIntParameter(const char* key, int fallback) const;
    std::string GetStringParameter(const char* key, const std::string& fallback) const;

    /// A file name, with forward slashes. Empties `out` on failure.
    bool GetFilenameParameterChk_C(const char* key, std::string& out, int position) const;

    /// Position of the first element that equals the value, or -1. Stops at the first element that
    /// can't be read. V is int or std::string.
    template<class V>
    int FindParameterPosition(const char* key, const V& value) const;

    /// T is void*, int, unsigned int, long long, unsigned long long, double, const char*, bool or
    /// std::string. ticket/TicketFamilies.h describes holes and failures.
    template<class T>
    bool GetVectorParameter(const char* key, std::vector<T>& out) const {
        return ticket::readVector(ticket::Single(*this), key, out);
    }

    /// File names, with forward slashes. Empties `out` on failure.
    bool GetFilenameVectorParameter_C(const char* key, std::vector<std::string>& out) const;

    /// T as for vectors, except std::string.
    template<class T>
    bool GetArrayParameter(const char* key, T* out, unsigned long count) const {
        return ticket::readArray(ticket::Single(*this), key, out, count);
    }

    /// Asks the plug-in to fill the record. If it refuses, the record becomes null, -1, -1.
    bool WhoAmI(STICKET_OPTION_WHOAMI& out) const;
};

/// Write access. The functions are const because the plug-in makes the change.
class STICKET_MODIFY : public STICKET_READ {
  public:
    /// Stores the pointer itself.
    bool SetParameter(const char* key, void* value, int position) const;

    bool xSetParameter(const char* key, PARAM_TYPE type, const void* value, int position) const;
    bool DelParameter(const char* key, int position) const;

    /// True if the plug-in accepted the table. Each record contains its own result.
    bool SetMultiParameter(SETMULTIPAR* table) const;

    /// Replaces the key. An empty vector deletes it. T as for GetVectorParameter.
    template<class T>
    bool SetVectorParameter(const char* key, const std::vector<T>& values) const {
        return ticket::writeVector(ticket::Single(*this), key, values);
    }

    bool SetFilenameVectorParameter(const char* key, const std::vector<std::string>& names) const;

    /// Replaces the key. An empty array deletes it, except for bool, which leaves it unchanged.
    template<class T>
    bool SetArrayParameter(const char* key, const T* values, unsigned long count) const {
        return ticket::writeArray(ticket::Single(*this), key, values, count);
    }

    /// Replaces this ticket's content by the source's listed keys, or by all for null.
    bool Assign(const STICKET_ACCESS* source, const char* const* keys) const;
    /// Copies the source's keys over those of this ticket.
    bool Merge(const STICKET_ACCESS* source, const char* const* keys) const;
};
