// SPDX-License-Identifier: Apache-2.0
// Tickets that exist as long as the process.
#pragma once

#include <map>
#include <utility>

#include "store/tickets/TicketStorage.h"

namespace store {

class MemoryStorage : public TicketStorage {
  public:
    std::vector<int> ids(int type) override;
    bool exists(int type, int id) override;
    bool create(int type, int id) override;
    int createNext(int type) override;
    bool remove(int type, int id) override;
    std::shared_ptr<const Elements> key(int type, int id, std::string_view key) override;
    std::shared_ptr<const TicketContent> content(int type, int id,
                                                 const KeyFilter& filter) override;
    bool apply(int type, int id, SETMULTIPAR* table) override;
    bool transfer(int type, int id, const TicketContent& source, bool replace) override;

  private:
    std::shared_ptr<TicketContent>* find(int type, int id);

    std::map<std::pair<int, int>, std::shared_ptr<TicketContent>> m_tickets;
    std::map<int, int> m_highestId; ///< By type: the highest id that ever existed.
};

} // namespace store
