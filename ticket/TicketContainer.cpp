// SPDX-License-Identifier: Apache-2.0
#include "ticket/TicketContainer.h"

using ticket::Contained;

namespace {

bool operate(const MTICKET_ACCESS& access, int type, int id, TICKET_OP op, void* argument) {
    return ticket::bit0(ticket::container::TicketOperation::call(access, type, id, op, argument));
}

bool notify(const MTICKET_ACCESS& access, int type, int id, int notificationId, int enable,
            const char* const* keys) {
    return ticket::bit0(
        ticket::container::Notification::call(access, type, id, notificationId, enable, keys));
}

bool appendId(void* context, int /*type*/, int id, const STICKET_ACCESS* /*access*/) {
    static_cast<std::vector<int>*>(context)->push_back(id);
    return true;
}

} // namespace

bool MTICKET_READ::TicketExists(int type, int id) const {
    return operate(*this, type, id, MTICKET_OP_EXISTS, nullptr);
}

const STICKET_ACCESS* MTICKET_READ::OpenTicket(int type, int id) const {
    const STICKET_ACCESS* access = nullptr;
    return operate(*this, type, id, MTICKET_OP_OPEN, &access) ? access : nullptr;
}

bool MTICKET_READ::GetTickets(int type, std::vector<int>& ids) const {
    ids.clear();
    if (TICKET_TYPE_Valid(type)) {
        WalkTickets(appendId, &ids, type);
    }
    return !ids.empty();
}

bool MTICKET_READ::WalkTickets(TicketWalk fn, void* context, int type) const {
    return ticket::bit0(ticket::container::WalkTickets::call(*this, fn, context, type));
}

bool MTICKET_READ::GetParameter(int type, int id, const char* key, std::string& out,
                                int position) const {
    return ticket::readString(Contained(*this, type, id), key, out, position);
}

int MTICKET_READ::GetIntParameter(int type, int id, const char* key, int fallback) const {
    return GetIntParameter(type, id, POSITION_WHOLE, key, fallback);
}

int MTICKET_READ::GetIntParameter(int type, int id, int position, const char* key,
                                  int fallback) const {
    return ticket::readInt(Contained(*this, type, id), key, fallback, position);
}

std::string MTICKET_READ::GetStringParameter(int type, int id, const char* key,
                                             const std::string& fallback) const {
    return ticket::readString(Contained(*this, type, id), key, fallback);
}

const char* MTICKET_READ::GetPszParameter(int type, int id, const char* key,
                                          const char* fallback) const {
    const char* text = ticket::readText(Contained(*this, type, id), key, POSITION_WHOLE);
    return text != nullptr ? text : fallback;
}

bool MTICKET_READ::GetFilenameParameterChk_C(int type, int id, const char* key, std::string& out,
                                             int position) const {
    return ticket::readFilename(Contained(*this, type, id), key, out, position);
}

bool MTICKET_READ::GetFilenameVectorParameter_C(int type, int id, const char* key,
                                                std::vector<std::string>& out) const {
    return ticket::readFilenames(Contained(*this, type, id), key, out);
}

bool MTICKET_MODIFY::DelParameter(int type, int id, const char* key, int position) const {
    return Contained(*this, type, id).set(key, PARAM_DELETE, nullptr, position);
}

bool MTICKET_MODIFY::SetMultiParameter(int type, int id, SETMULTIPAR* table) const {
    return Contained(*this, type, id).set(table);
}

bool MTICKET_MODIFY::SetFilenameVectorParameter(int type, int id, const char* key,
                                                const std::vector<std::string>& names) const {
    return ticket::writeFilenames(Contained(*this, type, id), key, names);
}

bool MTICKET_MODIFY::SetPartial(int type, int id, const char* const* keys) const {
    return operate(*this, type, id, STICKET_OP_PARTIAL, const_cast<const char**>(keys));
}

int MTICKET_ADMIN::CreateNextTicket(int type, bool flag) const {
    int created = -1;
    return operate(*this, type, flag ? TICKET_ID_NEW : TICKET_ID_NEW_PLAIN, MTICKET_OP_CREATE_NEXT,
                   &created)
               ? created
               : -1;
}

const STICKET_ACCESS* MTICKET_ADMIN::CreateOrOpenTicket(int type, int id,
                                                        const char* const* keys) const {
    const STICKET_ACCESS* access = nullptr;
    if (operate(*this, type, id, MTICKET_OP_OPEN, &access)) {
        return access;
    }
    if (ticket::container::CreateWithKeys::of(*this) == nullptr) {
        return nullptr;
    }
    return ticket::container::CreateWithKeys::call(*this, type, id, keys);
}

bool MTICKET_ADMIN::DeleteTicket(int type, int id, bool flag) const {
    return operate(*this, type, id, MTICKET_OP_DELETE, &flag);
}

bool MTICKET_ADMIN::EnableNotification(int type, int id, int notificationId,
                                       const char* const* keys) const {
    return notify(*this, type, id, notificationId, 1, keys);
}

bool MTICKET_ADMIN::DisableNotification(int type, int id, int notificationId) const {
    return notify(*this, type, id, notificationId, 0, nullptr);
}
