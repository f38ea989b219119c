// SPDX-License-Identifier: Apache-2.0
// Tickets as a JSON file (docs/ticket.schema.json):
//
//   {
//     "format": "tintgate tickets",
//     "version": 1,
//     "tickets": [
//       {
//         "type": 3,
//         "id": 7,
//         "keys": {
//           "Input/Title": {"string": "Summer catalogue"},
//           "Workflow/Verify/Active": {"int": 1}
//         },
//         "byteKeys": {
//           "gIE=": {"int": 1}
//         }
//       }
//     ]
//   }
//
// "byteKeys", which is seldom there, has keys that are no UTF-8, as base64. ElementsJson.h tells
// what stands behind a key.
#pragma once

#include <functional>
#include <iosfwd>
#include <string>
#include <vector>

#include "companions/tintgate-store/TicketName.h"
#include "store/tickets/TicketContent.h"

namespace admin {

struct NamedTicket {
    TicketName name;
    store::TicketContent content;
};

/// Reads and checks a file to its end. Throws Failure (BadInput) for all that is not exactly of the
/// format: unknown or repeated members, a ticket that stands there twice, values outside their
/// type. The text says where.
std::vector<NamedTicket> readTickets(std::istream& from);

/// Writes a file, ticket by ticket. It is whole once finish has been called.
class TicketsWriter {
  public:
    explicit TicketsWriter(std::ostream& to);
    void add(const TicketName& name, const store::TicketContent& content);
    void finish();

  private:
    std::ostream& m_to;
    bool m_first = true;
};

} // namespace admin
