// SPDX-License-Identifier: Apache-2.0
#include "store/tickets/TicketContainer.h"

#include <cstring>
#include <unordered_map>

namespace store {

namespace {

using Containers = std::unordered_map<const void*, TicketContainer*>;

/// By the address of their records. Never destroyed, because a container may outlive statics.
Containers& containers() {
    static auto& all = *new Containers;
    return all;
}

/// The container found last; consecutive calls usually have the same one.
struct {
    const void* handle = nullptr;
    TicketContainer* container = nullptr;
} lastFound;

TicketContainer* find(const void* handle) {
    if (handle != lastFound.handle) {
        const auto found = containers().find(handle);
        if (found == containers().end()) {
            return nullptr;
        }
        lastFound = {handle, found->second};
    }
    return lastFound.container;
}

/// Runs a function of the record on the container; false for an unknown handle.
template<class Body>
int on(void* handle, Body body) {
    return guarded([&] {
        auto* container = find(handle);
        return container != nullptr && body(*container);
    });
}

std::vector<std::string> listed(const char* const* keys) {
    std::vector<std::string> list;
    for (; keys != nullptr && *keys != nullptr; ++keys) {
        list.emplace_back(*keys);
    }
    return list;
}

int getParameter(void* handle, int type, int id, const char* key, PARAM_TYPE ptype, void* out,
                 int position) {
    return on(handle, [&](TicketContainer& container) {
        return key != nullptr && container.get(type, id, key, ptype, out, position);
    });
}

int getMultiParameter(void* handle, int type, int id, GETMULTIPAR* table) {
    auto* container = find(handle);
    getMultiple(table, [&](const char* key, PARAM_TYPE ptype, void* out, int position) {
        return container != nullptr && container->get(type, id, key, ptype, out, position);
    });
    return container != nullptr && table != nullptr;
}

int walkTickets(void* handle, TicketWalk callback, void* context, int type) {
    return on(handle, [&](TicketContainer& container) {
        return callback != nullptr && container.walkTickets(callback, context, type);
    });
}

int setParameter(void* handle, int type, int id, const char* key, PARAM_TYPE ptype,
                 const void* value, int position) {
    return on(handle, [&](TicketContainer& container) {
        return setSingle(key, ptype, value, position,
                         [&](SETMULTIPAR* table) { return container.apply(type, id, table); });
    });
}

int setMultiParameter(void* handle, int type, int id, SETMULTIPAR* table) {
    return guarded([&] {
        return setMultiple(table, [&](SETMULTIPAR* records) {
            auto* container = find(handle);
            return container != nullptr && container->apply(type, id, records);
        });
    });
}

bool openInto(TicketContainer& container, int type, int id, const STICKET_ACCESS** ticket) {
    if (ticket == nullptr) {
        return false;
    }
    const auto* opened = container.open(type, id);
    if (opened == nullptr) {
        return false;
    }
    *ticket = opened;
    return true;
}

bool createNextInto(TicketContainer& container, int type, int id, int* newId) {
    if (newId == nullptr || (id != TICKET_ID_NEW && id != TICKET_ID_NEW_PLAIN)) {
        return false;
    }
    const int created = container.createNext(type);
    if (created < 0) {
        return false;
    }
    *newId = created;
    return true;
}

int ticketOperation(void* handle, int type, int id, TICKET_OP op, void* argument) {
    return on(handle, [&](TicketContainer& container) {
        switch (op.code) {
        case STICKET_OP_PARTIAL:
            return container.setPartial(type, id, static_cast<const char* const*>(argument));
        case MTICKET_OP_EXISTS:
            return container.exists(type, id);
        case MTICKET_OP_OPEN:
            return openInto(container, type, id, static_cast<const STICKET_ACCESS**>(argument));
        case MTICKET_OP_CREATE_NEXT:
            return createNextInto(container, type, id, static_cast<int*>(argument));
        case MTICKET_OP_DELETE:
            return container.remove(type, id);
        default:
            return false;
        }
    });
}

int notification(void* handle, int type, int id, int notificationId, int enable,
                 const char* const* keys) {
    return on(handle, [&](TicketContainer& container) {
        return container.notify(type, id, notificationId, ticket::bit0(enable), keys);
    });
}

const STICKET_ACCESS* createWithKeys(void* handle, int type, int id, const char* const* keys) {
    const STICKET_ACCESS* ticket = nullptr;
    on(handle, [&](TicketContainer& container) {
        ticket = container.createWithKeys(type, id, keys);
        return true;
    });
    return ticket;
}

} // namespace

class TicketContainer::OpenedTicket : public Ticket {
  public:
    OpenedTicket(TicketContainer& container, int type, int id)
        : m_container(container), m_type(type), m_id(id) {}

    bool get(const char* key, PARAM_TYPE type, void* out, int position) override {
        return m_container.get(m_type, m_id, key, type, out, position);
    }

    std::shared_ptr<const TicketContent> content(const KeyFilter& filter) override {
        return m_container.content(m_type, m_id, filter);
    }

    std::shared_ptr<const TicketContent> shown() override {
        return m_container.shown(m_type, m_id);
    }

    bool apply(SETMULTIPAR* table) override { return m_container.apply(m_type, m_id, table); }

    bool transfer(const TicketContent& source, bool replace) override {
        return m_container.transfer(m_type, m_id, source, replace);
    }

    bool whoAmI(STICKET_OPTION_WHOAMI& record) override {
        record.pointer = const_cast<MTICKET_ACCESS*>(m_container.access());
        record.number1 = m_type;
        record.number2 = m_id;
        return true;
    }

  private:
    TicketContainer& m_container;
    const int m_type;
    const int m_id;
};

TicketContainer::TicketContainer(std::shared_ptr<TicketStorage> keep) : m_storage(std::move(keep)) {
    namespace slot = ticket::container;
    m_access.words[ticket::handleWord] = reinterpret_cast<std::uint64_t>(&m_access);
    slot::GetParameter::put(m_access, getParameter);
    slot::GetMultiParameter::put(m_access, getMultiParameter);
    slot::WalkTickets::put(m_access, store::walkTickets);
    slot::SetParameter::put(m_access, setParameter);
    slot::SetMultiParameter::put(m_access, setMultiParameter);
    slot::TicketOperation::put(m_access, ticketOperation);
    slot::Notification::put(m_access, notification);
    slot::CreateWithKeys::put(m_access, store::createWithKeys);
    containers().emplace(&m_access, this);
}

TicketContainer::~TicketContainer() {
    containers().erase(&m_access);
    lastFound = {};
}

bool TicketContainer::exists(int type, int id) {
    return TICKET_Valid(type, id) && m_storage->exists(type, id);
}

const STICKET_ACCESS* TicketContainer::open(int type, int id) {
    if (!exists(type, id)) {
        return nullptr;
    }
    auto& record = m_opened[{type, id}];
    if (!record) {
        record = std::make_unique<TicketRecord>(std::make_shared<OpenedTicket>(*this, type, id));
    }
    return record->access();
}

const STICKET_ACCESS* TicketContainer::createWithKeys(int type, int id, const char* const* keys) {
    if (!TICKET_Valid(type, id)) {
        return nullptr;
    }
    m_storage->create(type, id);
    setPartial(type, id, keys);
    return open(type, id);
}

int TicketContainer::createNext(int type) {
    return TICKET_TYPE_Valid(type) ? m_storage->createNext(type) : -1;
}

/// Keeps contents shown by walks unless there is a change. Released last: a table may point into
/// them.
template<class Change>
bool TicketContainer::change(int type, int id, Change change) {
    if (!TICKET_Valid(type, id)) {
        return false;
    }
    dropSnapshot();
    bool changed = true;
    if (!change(changed)) {
        return false;
    }
    if (changed) {
        m_shown.erase({type, id});
    }
    return true;
}

bool TicketContainer::remove(int type, int id) {
    if (!change(type, id, [&](bool&) { return m_storage->remove(type, id); })) {
        return false;
    }
    m_partial.erase({type, id});
    return true;
}

bool TicketContainer::walkTickets(TicketWalk callback, void* context, int type) {
    if (!TICKET_TYPE_Valid(type)) {
        return false;
    }
    for (const int id : m_storage->ids(type)) {
        // The callback may delete tickets that follow.
        if (const auto* ticket = open(type, id)) {
            if (!callback(context, type, id, ticket)) {
                break;
            }
        }
    }
    return true;
}

bool TicketContainer::get(int type, int id, const char* key, PARAM_TYPE ptype, void* out,
                          int position) {
    // A short path without fetching: arrays are read here one element at a time.
    if (position > 0 && m_snapshot.held && m_snapshot.address == Address(type, id) &&
        std::strcmp(m_snapshot.key.c_str(), key) == 0) {
        return readElement(m_snapshot.elements.get(), ptype, out, position, m_handedOut);
    }
    return fetchAndGet(type, id, key, ptype, out, position);
}

void TicketContainer::dropSnapshot() {
    m_snapshot.held = false;
    m_snapshot.elements.reset();
}

bool TicketContainer::fetchAndGet(int type, int id, const char* key, PARAM_TYPE ptype, void* out,
                                  int position) {
    if (!TICKET_Valid(type, id)) {
        return false;
    }
    dropSnapshot();
    m_snapshot.key = key;
    m_snapshot.elements = m_storage->key(type, id, m_snapshot.key);
    m_snapshot.address = {type, id};
    m_snapshot.held = true;
    return readElement(m_snapshot.elements.get(), ptype, out, position, m_handedOut);
}

std::shared_ptr<const TicketContent> TicketContainer::content(int type, int id,
                                                              const KeyFilter& filter) {
    return TICKET_Valid(type, id) ? m_storage->content(type, id, filter) : nullptr;
}

std::shared_ptr<const TicketContent> TicketContainer::shown(int type, int id) {
    auto content = this->content(type, id, KeyFilter());
    if (content == nullptr) {
        return nullptr;
    }
    auto& shown = m_shown[{type, id}];
    if (shown.empty() || !shown.back()->equals(*content)) {
        shown.push_back(std::move(content));
    }
    return shown.back();
}

bool TicketContainer::apply(int type, int id, SETMULTIPAR* table) {
    return change(type, id, [&](bool& changed) {
        const bool taken = m_storage->apply(type, id, table);
        const auto* record = table;
        while (record != nullptr && record->key != nullptr && !record->ok()) {
            ++record;
        }
        changed = record != nullptr && record->key != nullptr;
        return taken;
    });
}

bool TicketContainer::transfer(int type, int id, const TicketContent& source, bool replace) {
    return change(type, id, [&](bool&) { return m_storage->transfer(type, id, source, replace); });
}

bool TicketContainer::setPartial(int type, int id, const char* const* keys) {
    if (!exists(type, id)) {
        return false;
    }
    auto list = listed(keys);
    if (list.empty()) {
        m_partial.erase({type, id});
    } else {
        m_partial[{type, id}] = std::move(list);
    }
    return true;
}

std::vector<std::string> TicketContainer::partial(int type, int id) const {
    const auto found = m_partial.find({type, id});
    return found == m_partial.end() ? std::vector<std::string>() : found->second;
}

bool TicketContainer::notify(int type, int id, int notificationId, bool enable,
                             const char* const* keys) {
    const bool known = TICKET_ID_Valid(id) || id == TICKET_ID_ALL || id == TICKET_ID_NEW ||
                       id == TICKET_ID_NEW_PLAIN;
    if (!TICKET_TYPE_Valid(type) || !known) {
        return false;
    }
    if (enable) {
        m_notifications[{type, id, notificationId}] = listed(keys);
        return true;
    }
    std::erase_if(m_notifications, [&](const auto& entry) {
        const auto& [entryType, entryId, entryNotification] = entry.first;
        return entryType == type && (entryId == id || id == TICKET_ID_ALL) &&
               entryNotification == notificationId;
    });
    return true;
}

std::vector<TicketContainer::Notification> TicketContainer::notifications() const {
    std::vector<Notification> list;
    for (const auto& [address, keys] : m_notifications) {
        list.push_back({std::get<0>(address), std::get<1>(address), std::get<2>(address), keys});
    }
    return list;
}

} // namespace store
