// SPDX-License-Identifier: Apache-2.0
#include "store/tickets/MemoryStorage.h"

#include <algorithm>

namespace store {

std::shared_ptr<TicketContent>* MemoryStorage::find(int type, int id) {
    const auto found = m_tickets.find({type, id});
    return found == m_tickets.end() ? nullptr : &found->second;
}

std::vector<int> MemoryStorage::ids(int type) {
    std::vector<int> ids;
    for (auto it = m_tickets.lower_bound({type, 0}); it != m_tickets.end(); ++it) {
        if (it->first.first != type) {
            break;
        }
        ids.push_back(it->first.second);
    }
    return ids;
}

bool MemoryStorage::exists(int type, int id) {
    return find(type, id) != nullptr;
}

bool MemoryStorage::create(int type, int id) {
    if (exists(type, id)) {
        return false;
    }
    auto& highest = m_highestId[type];
    m_tickets.emplace(std::pair(type, id), std::make_shared<TicketContent>());
    highest = std::max(highest, id);
    return true;
}

int MemoryStorage::createNext(int type) {
    int id = m_highestId[type] + 1;
    if (!TICKET_ID_Valid(id)) {
        // All numbers are used; take the lowest free one.
        id = 1;
        while (exists(type, id)) {
            ++id;
        }
    }
    return TICKET_ID_Valid(id) && create(type, id) ? id : -1;
}

bool MemoryStorage::remove(int type, int id) {
    return m_tickets.erase({type, id}) != 0;
}

std::shared_ptr<const Elements> MemoryStorage::key(int type, int id, std::string_view key) {
    const auto* content = find(type, id);
    return content == nullptr ? nullptr : (*content)->find(key);
}

std::shared_ptr<const TicketContent> MemoryStorage::content(int type, int id,
                                                            const KeyFilter& filter) {
    const auto* content = find(type, id);
    if (content == nullptr) {
        return nullptr;
    }
    if (filter.all()) {
        return *content; // Later changes of the ticket don't affect this copy: see own().
    }
    return std::make_shared<TicketContent>((*content)->select(filter));
}

bool MemoryStorage::apply(int type, int id, SETMULTIPAR* table) {
    auto* content = find(type, id);
    if (content == nullptr) {
        return false;
    }
    own(*content).apply(table);
    return true;
}

bool MemoryStorage::transfer(int type, int id, const TicketContent& source, bool replace) {
    auto* content = find(type, id);
    if (content == nullptr) {
        return false;
    }
    own(*content).transfer(source, replace);
    return true;
}

} // namespace store
