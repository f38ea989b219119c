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
// "byteKeys", which is rare, contains keys that are not UTF-8, as base64. ElementsJson.h describes
// the values.
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

/// Reads and checks a whole file. Throws Failure (BadInput) for any deviation from the format:
/// unknown or repeated members, repeated tickets, values outside their type. The text describes the
/// place.
std::vector<NamedTicket> readTickets(std::istream& from);

/// Writes a file, ticket by ticket. The file is complete after finish.
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
