// A comm plug-in whose answers a test sets and whose calls it reads. It is a shared object in a
// bundle; its tickets are those of the real engine.
#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIModuleInterface.h"
#include "ticket/TicketContainer.h"

struct ScriptedPlugIn {
    std::vector<std::string> calls;     ///< Names of slots with their arguments.
    std::map<std::string, int> results; ///< By the name of the slot, for files its number; else 0.
    bool hasInterface = true;
    bool hasContainer = true;
    ComSessionRecord seen; ///< The record as Initialize or Login last saw it.
    std::string seenData;  ///< The bytes of SetTicketData.
    std::function<void(const std::string& local)> onGetFile;
    std::function<int(int kind, int* size, int* buffer)> onGetTicketData;

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
