// SPDX-License-Identifier: Apache-2.0
// Access to the parameters of one ticket in either of two ways. Code based on these classes works
// for a single ticket and for a ticket inside a container.
#pragma once

#include <type_traits>

#include "ticket/TicketRecords.h"

namespace ticket {

/// A ticket through its own record.
class Single {
  public:
    explicit Single(const STICKET_ACCESS& access) : m_access(access) {}

    bool get(const char* key, PARAM_TYPE type, void* out, int position) const {
        return bit0(single::GetParameter::call(m_access, key, type, out, position));
    }
    void get(GETMULTIPAR* table) const { single::GetMultiParameter::call(m_access, table); }

    bool set(const char* key, PARAM_TYPE type, const void* value, int position) const {
        return bit0(single::SetParameter::call(m_access, key, type, value, position));
    }
    bool set(SETMULTIPAR* table) const {
        return bit0(single::SetMultiParameter::call(m_access, table));
    }

  private:
    const STICKET_ACCESS& m_access;
};

/// A ticket through its container. Type and id are not checked.
class Contained {
  public:
    Contained(const MTICKET_ACCESS& access, int type, int id)
        : m_access(access), m_type(type), m_id(id) {}

    bool get(const char* key, PARAM_TYPE type, void* out, int position) const {
        return bit0(
            container::GetParameter::call(m_access, m_type, m_id, key, type, out, position));
    }
    void get(GETMULTIPAR* table) const {
        container::GetMultiParameter::call(m_access, m_type, m_id, table);
    }

    bool set(const char* key, PARAM_TYPE type, const void* value, int position) const {
        return bit0(
            container::SetParameter::call(m_access, m_type, m_id, key, type, value, position));
    }
    bool set(SETMULTIPAR* table) const {
        return bit0(container::SetMultiParameter::call(m_access, m_type, m_id, table));
    }

  private:
    const MTICKET_ACCESS& m_access;
    int m_type;
    int m_id;
};

/// Calls back with every value of the ticket.
inline void walk(const STICKET_ACCESS& access, SCollect callback, void* context) {
    // Only the plug-in interprets text and number. Callers have always passed these (C121).
    single::Walk::call(access, callback, context, "", 8000);
}

/// A plug-in's record as one of its views, at the same address, since views have no data.
template<class View, class Record>
const View& as(const Record& record) {
    static_assert(std::is_base_of_v<Record, View> && sizeof(View) == sizeof(Record));
    return static_cast<const View&>(record);
}

} // namespace ticket
