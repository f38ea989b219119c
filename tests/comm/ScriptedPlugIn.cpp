// SPDX-License-Identifier: Apache-2.0
#include "tests/comm/ScriptedPlugIn.h"

#include <memory>

#include "store/tickets/MemoryStorage.h"
#include "store/tickets/TicketContainer.h"
#include "store/tickets/WorkTickets.h"

#define EXPORTED extern "C" __attribute__((visibility("default")))

ScriptedPlugIn::ScriptedPlugIn() {
    static store::TicketContainer engine(std::make_shared<store::MemoryStorage>());
    access = *engine.access();
    set(0, 0, "System/Product/MajorVersion=5");
}

EXPORTED ScriptedPlugIn* scriptedPlugIn() {
    static ScriptedPlugIn state;
    return &state;
}

namespace {

constexpr std::uint64_t handle = 0x8877665544332211;
int instanceWord = 0;

/// Formats an argument of a call. Keeps the last record, size and data.
template<class Argument>
std::string shown(Argument argument) {
    ScriptedPlugIn& plugIn = *scriptedPlugIn();
    if constexpr (std::is_same_v<Argument, std::uint64_t>) {
        return argument == handle ? "" : " ?";
    } else if constexpr (std::is_same_v<Argument, int>) {
        return " " + std::to_string(argument);
    } else if constexpr (std::is_same_v<Argument, const char*>) {
        return std::string(" ") + (argument == nullptr ? "(null)" : argument);
    } else if constexpr (std::is_same_v<Argument, int*>) {
        plugIn.size = argument;
        return argument == nullptr ? "" : shown(*argument);
    } else if constexpr (std::is_same_v<Argument, ComSessionRecord*>) {
        plugIn.record = *argument;
        argument->session = handle;
    } else if constexpr (std::is_same_v<Argument, void*>) {
        plugIn.data = argument;
    }
    return "";
}

int answer(int slot, const std::string& arguments) {
    ScriptedPlugIn& plugIn = *scriptedPlugIn();
    plugIn.calls.push_back(std::to_string(slot) + arguments);
    if (plugIn.onCall) {
        plugIn.onCall(slot);
    }
    return plugIn.results[slot];
}

template<int Slot, class... Arguments>
std::int32_t call(void* instance, Arguments... arguments) {
    return answer(Slot,
                  (std::string(instance == &instanceWord ? "" : " ?") + ... + shown(arguments)));
}

std::int32_t createInstance(void** instance) {
    *instance = &instanceWord;
    return answer(4, "");
}

const MTICKET_ACCESS* getContainer(void* instance, std::uint64_t session) {
    call<12>(instance, session);
    return scriptedPlugIn()->hasContainer ? &scriptedPlugIn()->access : nullptr;
}

std::int32_t queryInterface(void*, CFUUIDBytes id, void** interface) {
    static ComGUIModuleInterface table = {
        .CreateInstance = createInstance,
        .Initialize = call<6>,
        .Login = call<9>,
        .Logout = call<10>,
        .Uninitialize = call<11>,
        .GetContainer = getContainer,
        .GetTicketData = call<13>,
        .SetTicketData = call<14>,
        .SendCommand = call<16>,
        .PutFile = call<17>,
        .GetFile = call<18>,
        .SendJob = call<19>,
        .PutFileRaw = call<20>,
        .hSTicketInstance = store::ticketFactory(),
        .GetFileRaw = call<24>,
        .IsAlive = call<26>,
    };
    static ComGUIModuleInterface* given = &table;
    const bool known = id.bytes[0] == 0x33 && id.bytes[15] == 0x6E;
    *interface = known && scriptedPlugIn()->hasInterface ? &given : nullptr;
    return 0;
}

std::uint32_t release(void*) {
    return static_cast<std::uint32_t>(answer(3, ""));
}

} // namespace

// The object that the factory creates differs from the requested interface.
EXPORTED void* makeScriptedPlugIn(const void*, const void*) {
    static ComGUIModuleInterface header = {.QueryInterface = queryInterface, .Release = release};
    static ComGUIModuleInterface* object = &header;
    return &object;
}
