// A comm plug-in whose answers a test sets and whose calls it reads. It is a shared object in a
// bundle; its tickets are those of the real engine. Slots go by their numbers.
#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIModuleInterface.h"
#include "ticket/TicketContainer.h"
#include "ticket/TicketSlots.h"

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
    void set(int type, int id, const char* key, PARAM_TYPE ptype, const void* value,
             int position = POSITION_WHOLE) const {
        ticket::Contained(access, type, id).set(key, ptype, value, position);
    }
    void set(int type, int id, const char* key, int value) const {
        set(type, id, key, PARAM_INT, &value);
    }
    void set(int type, int id, const char* key, const char* value) const {
        set(type, id, key, PARAM_STRING, value);
    }
};
