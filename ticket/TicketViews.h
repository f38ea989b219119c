// SPDX-License-Identifier: Apache-2.0
// Views on one ticket's record, which add what the plug-in does not offer: strings, vectors,
// arrays, booleans and file names.
#pragma once

#include <string>
#include <vector>

#include "ticket/TicketFamilies.h"

/// Reading. The view is the plug-in's record itself, at the same address (ticket::as), and has no
/// data. A false is all there is of a failure. Positions: POSITION_WHOLE or an element.
class STICKET_READ : public STICKET_ACCESS {
  public:
    bool ParameterExists(const char* key, int position) const;

    /// On false `out` is empty.
    bool GetParameter(const char* key, std::string& out, int position) const;
    /// On false `out` is as it was.
    bool GetParameter(const char* key, int& out, int position) const;

    int GetIntParameter(const char* key, int fallback) const;
    std::string GetStringParameter(const char* key, const std::string& fallback) const;

    /// A file name, with forward slashes; empty on false.
    bool GetFilenameParameterChk_C(const char* key, std::string& out, int position) const;

    /// The first element that equals the value, or -1. Elements are tried from 0 up to the first
    /// that can't be read. V is int or std::string.
    template<class V>
    int FindParameterPosition(const char* key, const V& value) const;

    /// T is void*, int, unsigned int, long long, unsigned long long, double, const char*, bool or
    /// std::string; ticket/TicketFamilies.h tells what becomes of holes and failures.
    template<class T>
    bool GetVectorParameter(const char* key, std::vector<T>& out) const {
        return ticket::readVector(ticket::Single(*this), key, out);
    }

    /// File names, with forward slashes; empty on false.
    bool GetFilenameVectorParameter_C(const char* key, std::vector<std::string>& out) const;

    /// T as for vectors, without std::string.
    template<class T>
    bool GetArrayParameter(const char* key, T* out, unsigned long count) const {
        return ticket::readArray(ticket::Single(*this), key, out, count);
    }

    /// Asks the plug-in to fill the record; null, -1, -1 where it refuses.
    bool WhoAmI(STICKET_OPTION_WHOAMI& out) const;
};

/// Changing. Const, since the change is made behind the plug-in.
class STICKET_MODIFY : public STICKET_READ {
  public:
    /// Stores the pointer itself.
    bool SetParameter(const char* key, void* value, int position) const;

    bool xSetParameter(const char* key, PARAM_TYPE type, const void* value, int position) const;
    bool DelParameter(const char* key, int position) const;

    /// True when the plug-in took the table; each record tells what became of it.
    bool SetMultiParameter(SETMULTIPAR* table) const;

    /// Replaces the key; no elements delete it. T as for GetVectorParameter.
    template<class T>
    bool SetVectorParameter(const char* key, const std::vector<T>& values) const {
        return ticket::writeVector(ticket::Single(*this), key, values);
    }

    bool SetFilenameVectorParameter(const char* key, const std::vector<std::string>& names) const;

    /// Replaces the key; no elements delete it, but for bool, where they leave it alone.
    template<class T>
    bool SetArrayParameter(const char* key, const T* values, unsigned long count) const {
        return ticket::writeArray(ticket::Single(*this), key, values, count);
    }

    /// This ticket's content becomes the source's: of the listed keys, or of all for null.
    bool Assign(const STICKET_ACCESS* source, const char* const* keys) const;
    /// The source's keys take their places in this ticket.
    bool Merge(const STICKET_ACCESS* source, const char* const* keys) const;
};
