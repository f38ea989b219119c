// SPDX-License-Identifier: Apache-2.0
// A comm plug-in whose answers a test sets and whose calls it reads. It is a shared object in a
// bundle; its tickets are those of the real engine. Slots go by their numbers.
#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIModuleInterface.h"
#include "TicketText.h"
#include "ticket/TicketContainer.h"

struct ScriptedPlugIn {
    /// Each with its texts and integers: "26 host 50005". Instance and session are not shown if
    /// they are those that were given out, and "?" otherwise.
    std::vector<std::string> calls;
    std::map<int, int> results; ///< 0 where nothing is set.
    std::function<void(int slot)> onCall;
    bool hasInterface = true;
    bool hasContainer = true;

    // Of the last call that had one.
    ComSessionRecord record;
    int* size = nullptr;
    void* data = nullptr;

    MTICKET_ACCESS access; ///< A copy of the container's record, whose words may be replaced.

    ScriptedPlugIn();
    const MTICKET_ADMIN& tickets() const { return ticket::as<MTICKET_ADMIN>(access); }
    /// Sends a table, in the words of TicketText.h, to a ticket that is made where there is none.
    void set(int type, int id, const std::string& records) const {
        tickets().CreateOrOpenTicket(type, id, nullptr);
        tickets().SetMultiParameter(type, id, support::RecordTable(records).records());
    }
};
