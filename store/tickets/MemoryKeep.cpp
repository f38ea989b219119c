// SPDX-License-Identifier: Apache-2.0
#include "store/tickets/MemoryKeep.h"

#include <algorithm>

namespace store {

std::shared_ptr<TicketContent>* MemoryKeep::find(int type, int id) {
    const auto found = m_tickets.find({type, id});
    return found == m_tickets.end() ? nullptr : &found->second;
}

std::vector<int> MemoryKeep::ids(int type) {
    std::vector<int> ids;
    for (auto it = m_tickets.lower_bound({type, 0}); it != m_tickets.end(); ++it) {
        if (it->first.first != type) {
            break;
        }
        ids.push_back(it->first.second);
    }
    return ids;
}

bool MemoryKeep::exists(int type, int id) {
    return find(type, id) != nullptr;
}

bool MemoryKeep::create(int type, int id) {
    if (exists(type, id)) {
        return false;
    }
    auto& highest = m_highestId[type];
    m_tickets.emplace(std::pair(type, id), std::make_shared<TicketContent>());
    highest = std::max(highest, id);
    return true;
}

int MemoryKeep::createNext(int type) {
    int id = m_highestId[type] + 1;
    if (!TICKET_ID_Valid(id)) {
        // The numbers are used up: the lowest that is free.
        id = 1;
        while (exists(type, id)) {
            ++id;
        }
    }
    return TICKET_ID_Valid(id) && create(type, id) ? id : -1;
}

bool MemoryKeep::remove(int type, int id) {
    return m_tickets.erase({type, id}) != 0;
}

std::shared_ptr<const Elements> MemoryKeep::key(int type, int id, std::string_view key) {
    const auto* content = find(type, id);
    return content == nullptr ? nullptr : (*content)->find(key);
}

std::shared_ptr<const TicketContent> MemoryKeep::content(int type, int id,
                                                         const KeyFilter& filter) {
    const auto* content = find(type, id);
    if (content == nullptr) {
        return nullptr;
    }
    if (filter.all()) {
        return *content; // A change of the ticket then leaves this one as it is: see own().
    }
    return std::make_shared<TicketContent>((*content)->select(filter));
}

bool MemoryKeep::apply(int type, int id, SETMULTIPAR* table) {
    auto* content = find(type, id);
    if (content == nullptr) {
        return false;
    }
    own(*content).apply(table);
    return true;
}

bool MemoryKeep::transfer(int type, int id, const TicketContent& source, bool replace) {
    auto* content = find(type, id);
    if (content == nullptr) {
        return false;
    }
    own(*content).transfer(source, replace);
    return true;
}

} // namespace store
