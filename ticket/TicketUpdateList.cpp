// SPDX-License-Identifier: Apache-2.0
#include "ticket/TicketUpdateList.h"

#include <utility>

#include "text/LocaleSettings.h"
#include "ticket/TicketAccess.h"
#include "ticket/TicketFactory.h"
#include "ticket/TicketFilenames.h"
#include "ticket/TicketUpdateLog.h"

namespace {

constexpr int firstVirtualID = -9999;
constexpr int lastVirtualID = -2000;

const STICKET_MODIFY& view(const STICKET_ACCESS* access) {
    return ticket::as<STICKET_MODIFY>(*access);
}

/// Returns null if there is no container, as if the ticket did not exist.
const STICKET_ACCESS* openTicket(const MTICKET_ACCESS* container, int type, int id) {
    return container != nullptr ? ticket::as<MTICKET_READ>(*container).OpenTicket(type, id)
                                : nullptr;
}

template<class T>
T valueAt(const void* value) {
    return *static_cast<const T*>(value);
}

/// Does not dereference a null value: it means a deletion, whatever its type.
void logValue(clTICKET_UPDATE_LOG& log, PARAM_TYPE type, const void* value) {
    if (type == PARAM_DELETE) {
        log.printf("DEL");
    } else if (type == PARAM_POINTER) {
        log.printf("%p", value);
    } else if (value != nullptr) {
        switch (type) {
        case PARAM_INT:
            return log.printf("%d", valueAt<int>(value));
        case PARAM_DOUBLE:
            return log.printf("%lg", valueAt<double>(value));
        case PARAM_STRING:
            return log.printf("%s", static_cast<const char*>(value));
        case PARAM_INT64:
            return log.printf("%lld", valueAt<long long>(value));
        case PARAM_UINT:
            return log.printf("%u", valueAt<unsigned int>(value));
        case PARAM_UINT64:
            return log.printf("%llu", valueAt<unsigned long long>(value));
        default:
            return;
        }
    }
}

/// Inserts an entry with a work ticket, or returns the existing one.
TICKET_UPDATE_LIST::ENTRY* insertEntry(std::map<TICKET_TYPE_ID, TICKET_UPDATE_LIST::ENTRY>& entries,
                                       int type, int id) {
    if (!TICKET_UPDATE_LIST::TicketValid(type, id)) {
        return nullptr;
    }
    const auto [place, isNew] = entries.try_emplace(TICKET_TYPE_ID(type, id));
    if (isNew) {
        place->second.ticket = CreateTicket(nullptr);
        if (place->second.ticket == nullptr) {
            entries.erase(place);
            return nullptr;
        }
    }
    return &place->second;
}

const TICKET_UPDATE_LIST::ENTRY*
findEntry(const std::map<TICKET_TYPE_ID, TICKET_UPDATE_LIST::ENTRY>& entries, int type, int id) {
    if (!TICKET_UPDATE_LIST::TicketValid(type, id)) {
        return nullptr;
    }
    const auto place = entries.find(TICKET_TYPE_ID(type, id));
    return place != entries.end() ? &place->second : nullptr;
}

bool eraseEntry(std::map<TICKET_TYPE_ID, TICKET_UPDATE_LIST::ENTRY>& entries, int type, int id) {
    return TICKET_UPDATE_LIST::TicketValid(type, id) &&
           entries.erase(TICKET_TYPE_ID(type, id)) != 0;
}

} // namespace

int TICKET_UPDATE_LIST::nextID = firstVirtualID;

void TICKET_UPDATE_LIST::ENTRY::destruct() {
    if (const STICKET_ACCESS* taken = std::exchange(ticket, nullptr)) {
        DestroyTicket(taken);
    }
}

TICKET_UPDATE_LIST::ENTRY* TICKET_UPDATE_LIST::InsertMap(int type, int id) {
    return insertEntry(m_changed, type, id);
}

TICKET_UPDATE_LIST::ENTRY* TICKET_UPDATE_LIST::InsertToDeleteMap(int type, int id) {
    return insertEntry(m_toDelete, type, id);
}

const TICKET_UPDATE_LIST::ENTRY* TICKET_UPDATE_LIST::FindMap(int type, int id) const {
    return findEntry(m_changed, type, id);
}

const TICKET_UPDATE_LIST::ENTRY* TICKET_UPDATE_LIST::FindDeleteMap(int type, int id) const {
    return findEntry(m_toDelete, type, id);
}

bool TICKET_UPDATE_LIST::EraseMap(int type, int id) {
    return eraseEntry(m_changed, type, id);
}

bool TICKET_UPDATE_LIST::EraseDeletedMap(int type, int id) {
    return eraseEntry(m_toDelete, type, id);
}

int TICKET_UPDATE_LIST::NextTicketID() {
    const int id = nextID++;
    if (nextID > lastVirtualID) {
        nextID = firstVirtualID;
    }
    clTICKET_UPDATE_LOG(ticket::updateLogName).printf("NextTicketID() %d\n", id);
    return id;
}

bool TICKET_UPDATE_LIST::GetActualTicketID(int& real, int virtualId) const {
    clTICKET_UPDATE_LOG log(ticket::updateLogName);
    const auto found = m_idMap.find(virtualId);
    if (found == m_idMap.end()) {
        real = -1;
        log.printf("GetActualTicketID() %d -> %d FAILED\n", virtualId, real);
        return false;
    }
    real = found->second;
    log.printf("GetActualTicketID() %d -> %d\n", virtualId, real);
    return true;
}

bool TICKET_UPDATE_LIST::TICKET_ID_Next(int id) {
    return id == TICKET_ID_NEW || (id >= firstVirtualID && id <= lastVirtualID);
}

bool TICKET_UPDATE_LIST::TicketValid(int& type, int id) {
    if (TICKET_ID_Valid(id)) {
        return type == TICKET_TYPE_LOCAL || TICKET_TYPE_Valid(type);
    }
    if (!TICKET_ID_Next(id)) {
        return false;
    }
    if (!TICKET_TYPE_Valid(type)) {
        type = -1;
    }
    return true;
}

bool TICKET_UPDATE_LIST::xSetParameter(int type, int id, const char* key, PARAM_TYPE ptype,
                                       const void* value, int position, bool broadcast) {
    clTICKET_UPDATE_LOG log(ticket::updateLogName);
    log.printf("(%d, %d) %s[%d] <", type, id, key != nullptr ? key : "(NULL)", position);
    logValue(log, ptype, value);

    std::string translated;
    bool translatable = true;
    if (ptype == PARAM_STRING && m_translate != nullptr) {
        switch (m_translate(m_translateContext, translated, static_cast<const char*>(value))) {
        case 0:
            break;
        case 1:
            value = translated.c_str();
            break;
        default:
            translatable = false;
        }
    }
    log.printf(">");
    if (!translatable) {
        log.printf(" UNTRANSLATEABLE\n");
        return false;
    }

    ENTRY* entry = InsertMap(type, id);
    if (entry == nullptr || key == nullptr) {
        log.printf(" INVALID\n");
        return false;
    }
    ENTRY* kept = nullptr;
    if (value == nullptr) {
        entry->deletedKeys.insert(key);
        kept = InsertToDeleteMap(type, id);
    } else {
        entry->deletedKeys.erase(key);
    }
    const bool isNew = entry->changedKeys.insert(key).second;
    m_empty = false;

    // Changing a single element requires the server's other elements of the key around it.
    if (position != POSITION_WHOLE && isNew && m_container != nullptr && TICKET_Valid(type, id)) {
        const char* const keys[] = {key, nullptr};
        view(entry->ticket).Merge(openTicket(m_container, type, id), keys);
        log.printf(" (got original vector)");
    }
    if (kept != nullptr) {
        KeepDeleted(*kept, type, id, key, position);
    }
    const bool ok = view(entry->ticket).xSetParameter(key, ptype, value, position);
    log.printf(ok ? "\n" : " FAILED\n");
    if (broadcast) {
        BroadcastKeyChange(type, id, key, ptype, value);
    }
    return ok;
}

void TICKET_UPDATE_LIST::KeepDeleted(const ENTRY& kept, int type, int id, const char* key,
                                     int position) {
    const STICKET_ACCESS* original = openTicket(m_container, type, id);
    if (original == nullptr) {
        return;
    }
    const ticket::Single source(*original);
    PARAM_TYPE ptype = PARAM_DELETE;
    if (!source.get(key, PARAM_DELETE, &ptype, position)) {
        return;
    }
    int number = 0;
    double real = 0;
    const char* text = nullptr;
    const void* value = nullptr;
    switch (ptype) {
    case PARAM_INT:
        value = source.get(key, ptype, &number, position) ? &number : nullptr;
        break;
    case PARAM_DOUBLE:
        value = source.get(key, ptype, &real, position) ? &real : nullptr;
        break;
    case PARAM_STRING:
        value = source.get(key, ptype, &text, position) ? text : nullptr;
        break;
    default: // Values of other types are not kept (C138).
        break;
    }
    if (value != nullptr) {
        // Appended, so that deleted elements are in the order of their deletion.
        view(kept.ticket)
            .xSetParameter(key, ptype, value,
                           position == POSITION_WHOLE ? POSITION_WHOLE : POSITION_APPEND);
    }
}

bool TICKET_UPDATE_LIST::DelParameter(int type, int id, const char* key, int position,
                                      bool broadcast) {
    return xSetParameter(type, id, key, PARAM_DELETE, nullptr, position, broadcast);
}

bool TICKET_UPDATE_LIST::AddParameter(int type, int id, const char* key, const std::string& value,
                                      bool broadcast) {
    return xSetParameter(type, id, key, PARAM_STRING, value.c_str(), POSITION_APPEND, broadcast);
}

template<>
bool TICKET_UPDATE_LIST::SetVectorParameter(int type, int id, const char* key,
                                            const std::vector<std::string>& texts) {
    DelParameter(type, id, key, POSITION_WHOLE, false);
    for (const std::string& text : texts) {
        AddParameter(type, id, key, text, false);
    }
    BroadcastKeyChange(type, id, key, PARAM_COUNT, nullptr);
    return true;
}

bool TICKET_UPDATE_LIST::SetFilenameVectorParameter(int type, int id, const char* key,
                                                    const std::vector<std::string>& names) {
    std::vector<std::string> slashed;
    FilenamesToTicket(slashed, names);
    return SetVectorParameter(type, id, key, slashed);
}

bool TICKET_UPDATE_LIST::ParameterExists(int type, int id, const char* key) const {
    const ENTRY* entry = FindMap(type, id);
    return entry != nullptr && key != nullptr && view(entry->ticket).ParameterExists(key, 0);
}

bool TICKET_UPDATE_LIST::ParameterChanged(int type, int id, const char* key) const {
    const ENTRY* entry = FindMap(type, id);
    return entry != nullptr && key != nullptr && entry->changedKeys.contains(key);
}

int TICKET_UPDATE_LIST::xGetParameter(int type, int id, const char* key, PARAM_TYPE ptype,
                                      void* out, int position) {
    if (!ParameterChanged(type, id, key)) {
        return 0;
    }
    const ENTRY* entry = FindMap(type, id);
    if (out != nullptr && ticket::Single(*entry->ticket).get(key, ptype, out, position)) {
        if (ptype == PARAM_STRING) {
            ConvertHandedOut(*static_cast<const char**>(out));
        }
        return 1;
    }
    return entry->deletedKeys.contains(key) ? 2 : 0;
}

void TICKET_UPDATE_LIST::ConvertHandedOut(const char*& text) {
    LocaleSettings::GetMacSystemEncoding(); // The result is not used (C139).
    std::string converted;
    if (CharSetsWx::Io2Controls(CharSetsWx::Context, converted, text) == 1) {
        const wxCriticalSectionLocker lock(m_cacheLock);
        text = m_stringCache[converted.c_str()];
    }
}

template<class T>
int TICKET_UPDATE_LIST::xGetVectorParameter(int type, int id, const char* key,
                                            std::vector<T>& out) const {
    if (!ParameterChanged(type, id, key)) {
        return 0;
    }
    const ENTRY* entry = FindMap(type, id);
    return view(entry->ticket).GetVectorParameter(key, out) || entry->deletedKeys.contains(key);
}

template<class T>
int TICKET_UPDATE_LIST::xGetDeletedVectorParameter(int type, int id, const char* key,
                                                   std::vector<T>& out) const {
    const ENTRY* entry = FindDeleteMap(type, id);
    if (entry == nullptr || key == nullptr) {
        return 0;
    }
    view(entry->ticket).GetVectorParameter(key, out);
    return 1;
}

template int TICKET_UPDATE_LIST::xGetVectorParameter(int, int, const char*,
                                                     std::vector<int>&) const;
template int TICKET_UPDATE_LIST::xGetVectorParameter(int, int, const char*,
                                                     std::vector<double>&) const;
template int TICKET_UPDATE_LIST::xGetVectorParameter(int, int, const char*,
                                                     std::vector<std::string>&) const;
template int TICKET_UPDATE_LIST::xGetDeletedVectorParameter(int, int, const char*,
                                                            std::vector<int>&) const;
template int TICKET_UPDATE_LIST::xGetDeletedVectorParameter(int, int, const char*,
                                                            std::vector<double>&) const;
template int TICKET_UPDATE_LIST::xGetDeletedVectorParameter(int, int, const char*,
                                                            std::vector<std::string>&) const;

void TICKET_UPDATE_LIST::Merge(int type, int id, const STICKET_ACCESS* source,
                               const char* const* keys) {
    if (keys != nullptr && keys[0] != nullptr) {
        MergeFiltered(type, id, source, PARTIAL_MODE(keys));
    } else {
        MergeAll(type, id, source);
    }
}

void TICKET_UPDATE_LIST::Merge(int type, int id, const STICKET_ACCESS* source,
                               const PARTIAL_MODE& mode) {
    if (mode.partial()) {
        MergeFiltered(type, id, source, mode);
    } else {
        MergeAll(type, id, source);
    }
}

void TICKET_UPDATE_LIST::MergeFiltered(int type, int id, const STICKET_ACCESS* source,
                                       const PARTIAL_MODE& mode) {
    if (source != nullptr) {
        UPDATE_PARTIAL_COLLECT_ACTION action{this, type, id, &mode};
        ticket::walk(*source, UPDATE_PARTIAL_COLLECT_ACTION::CollectAction, &action);
    }
}

void TICKET_UPDATE_LIST::MergeAll(int type, int id, const STICKET_ACCESS* source) {
    if (source != nullptr) {
        FULL_COLLECT_ACTION action{this, type, id};
        ticket::walk(*source, CollectAction, &action);
    }
}

bool TICKET_UPDATE_LIST::CollectAction(void* context, const char* key, PARAM_TYPE type,
                                       const void* value, int position) {
    if (ticket::isValueType(type)) {
        const auto& action = *static_cast<FULL_COLLECT_ACTION*>(context);
        action.list->xSetParameter(action.type, action.id, key, type, value, position, true);
    }
    return true;
}

bool UPDATE_PARTIAL_COLLECT_ACTION::SetParameter(const char* key, PARAM_TYPE ptype,
                                                 const void* value, int position) {
    return key == nullptr || !mode->multi_contains(key) ||
           list->xSetParameter(type, id, key, ptype, value, position, true);
}

bool UPDATE_PARTIAL_COLLECT_ACTION::CollectAction(void* context, const char* key, PARAM_TYPE type,
                                                  const void* value, int position) {
    if (ticket::isValueType(type)) {
        static_cast<UPDATE_PARTIAL_COLLECT_ACTION*>(context)->SetParameter(key, type, value,
                                                                           position);
    }
    return true;
}

bool TICKET_UPDATE_LIST::RegisterSetParamCallback(SetParamCallback callback) {
    m_setParamCallback = std::move(callback);
    return true;
}

void TICKET_UPDATE_LIST::BroadcastKeyChange(int type, int id, const char* key, PARAM_TYPE ptype,
                                            const void* value) {
    if (m_setParamCallback) {
        m_setParamCallback(type, id, key, ptype, value);
    }
}

bool TICKET_UPDATE_LIST::IsEmpty(int type, int id) const {
    const ENTRY* entry = FindMap(type, id);
    return entry == nullptr || (entry->changedKeys.empty() && entry->deletedKeys.empty());
}

bool TICKET_UPDATE_LIST::GetChangedKeysList(int type, int id, std::set<std::string>& keys) {
    const ENTRY* entry = FindMap(type, id);
    if (entry == nullptr || entry->changedKeys.empty()) {
        return false;
    }
    keys = entry->changedKeys;
    return true;
}

void TICKET_UPDATE_LIST::GetChangedTickets(std::vector<TICKET_TYPE_ID>& tickets) {
    for (const auto& [address, entry] : m_changed) {
        tickets.push_back(address);
    }
}

void TICKET_UPDATE_LIST::Clear() {
    clTICKET_UPDATE_LOG(ticket::updateLogName).printf("Clear()\n");
    m_changed.clear();
    m_toDelete.clear();
    m_empty = true;
}

bool TICKET_UPDATE_LIST::Clear(int type, int id) {
    if (EraseMap(type, id)) {
        m_empty = m_changed.empty();
    }
    if (!EraseDeletedMap(type, id)) {
        return false;
    }
    // Only the deleted values count here, not the changes of other tickets (C137).
    m_empty = m_toDelete.empty();
    return true;
}
