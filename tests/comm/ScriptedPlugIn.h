// SPDX-License-Identifier: Apache-2.0
// A comm plug-in with answers set by a test and with recorded calls. It is a shared object in a
// bundle; its tickets are those of the real engine. Slots are identified by number.
#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIModuleInterface.h"
#include "TicketText.h"
#include "ticket/TicketContainer.h"

struct ScriptedPlugIn {
    /// Each call with its texts and integers: "26 host 50005". Instance and session are omitted if
    /// they are the correct ones, and shown as "?" otherwise.
    std::vector<std::string> calls;
    std::map<int, int> results; ///< 0 if not set.
    std::function<void(int slot)> onCall;
    bool hasInterface = true;
    bool hasContainer = true;

    // From the latest call that had one.
    ComSessionRecord record;
    int* size = nullptr;
    void* data = nullptr;

    MTICKET_ACCESS access; ///< A copy of the container's record. A test may replace its words.

    ScriptedPlugIn();
    const MTICKET_ADMIN& tickets() const { return ticket::as<MTICKET_ADMIN>(access); }
    /// Sends a table, in the notation of TicketText.h, to a ticket, which is created if necessary.
    void set(int type, int id, const std::string& records) const {
        tickets().CreateOrOpenTicket(type, id, nullptr);
        tickets().SetMultiParameter(type, id, support::RecordTable(records).records());
    }
};
