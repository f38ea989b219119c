#include "tests/comm/ScriptedPlugIn.h"

#include <cstring>
#include <memory>

#include "comgui/MemoryKeep.h"
#include "comgui/TicketContainer.h"
#include "comgui/WorkTickets.h"

#define EXPORTED extern "C" __attribute__((visibility("default")))

ScriptedPlugIn::ScriptedPlugIn() {
    static store::TicketContainer engine(std::make_shared<store::MemoryKeep>());
    access = *engine.access();
    engine.createWithKeys(0, 0, nullptr);
    set(0, 0, "System/Product/MajorVersion", 5);
}

EXPORTED ScriptedPlugIn* scriptedPlugIn() {
    static ScriptedPlugIn state;
    return &state;
}

namespace {

constexpr std::uint64_t handle = 0x8877665544332211;
int instanceWord = 0;

std::string text(const char* value) {
    return value == nullptr ? "(null)" : value;
}

int answer(const std::string& slot, const std::string& arguments = "") {
    ScriptedPlugIn& state = *scriptedPlugIn();
    state.calls.push_back(slot + arguments);
    return state.results.count(slot) != 0 ? state.results[slot] : 0;
}

// Instance and session have to be those that were given out.
int answer(const std::string& slot, void* instance, std::uint64_t session,
           const std::string& arguments = "") {
    const bool known = instance == &instanceWord && session == handle;
    return answer(slot, (known ? "" : " STRANGER") + arguments);
}

int see(const char* slot, void* instance, ComSessionRecord* record) {
    scriptedPlugIn()->seen = *record;
    record->session = handle;
    return answer(slot, instance, handle);
}

template<int Slot>
int file(void* instance, std::uint64_t session, const char* first, const char* second) {
    const int result =
        answer(std::to_string(Slot), instance, session, " " + text(first) + " " + text(second));
    if (Slot == 18 && scriptedPlugIn()->onGetFile) {
        scriptedPlugIn()->onGetFile(first);
    }
    return result;
}

ComGUIModuleInterface operations() {
    ComGUIModuleInterface table;
    table.CreateInstance = [](void** instance) {
        *instance = &instanceWord;
        return answer("CreateInstance");
    };
    table.Initialize = [](void* instance, ComSessionRecord* record) {
        return see("Initialize", instance, record);
    };
    table.Login = [](void* instance, ComSessionRecord* record) {
        return see("Login", instance, record);
    };
    table.Logout = [](void* instance, std::uint64_t session) {
        return answer("Logout", instance, session);
    };
    table.Uninitialize = [](void* instance, ComSessionRecord*) {
        return answer("Uninitialize", instance, handle);
    };
    table.GetContainer = [](void* instance, std::uint64_t session) -> const MTICKET_ACCESS* {
        answer("GetContainer", instance, session);
        return scriptedPlugIn()->hasContainer ? &scriptedPlugIn()->access : nullptr;
    };
    table.GetTicketData = [](void* instance, std::uint64_t session, int type, int kind, int,
                             int* size, void* buffer) {
        const int result = answer("GetTicketData", instance, session,
                                  " " + std::to_string(type) + " " + std::to_string(kind) + " " +
                                      std::to_string(*size));
        const auto& script = scriptedPlugIn()->onGetTicketData;
        return script ? script(kind, size, static_cast<int*>(buffer)) : result;
    };
    table.SetTicketData = [](void* instance, std::uint64_t session, int, int, int, int* size,
                             void* buffer) {
        const auto length = static_cast<std::size_t>(size == nullptr ? 0 : *size);
        scriptedPlugIn()->seenData.assign(static_cast<const char*>(buffer), length);
        return answer("SetTicketData", instance, session);
    };
    table.SendCommand = [](void* instance, std::uint64_t session, const char* command, int size,
                           void* data) {
        if (std::strcmp(command, "local.set.callback") == 0) {
            const int id = 77;
            ticket::single::SetParameter::call(*static_cast<const STICKET_ACCESS*>(data),
                                               "iGUINotificationID", PARAM_INT, &id,
                                               POSITION_WHOLE);
        }
        return answer("SendCommand", instance, session,
                      " " + text(command) + " " + std::to_string(size));
    };
    table.PutFile = file<17>;
    table.GetFile = file<18>;
    table.SendJob = [](void* instance, std::uint64_t session, TJobIdentification*,
                       const char* first,
                       const char* second) { return file<19>(instance, session, first, second); };
    table.PutFileRaw = file<20>;
    table.hSTicketInstance = store::ticketFactory();
    table.GetFileRaw = file<24>;
    table.IsAlive = [](void* instance, const char* host, int port) {
        return answer("IsAlive", instance, handle, " " + text(host) + " " + std::to_string(port));
    };
    return table;
}

constexpr unsigned char interfaceID[16] = {0x33, 0xFC, 0x3B, 0x14, 0x6C, 0xFF, 0x11, 0xD8,
                                           0xAB, 0x09, 0x00, 0x30, 0x65, 0xB1, 0x34, 0x6E};

} // namespace

// The object that the factory makes is not the interface that it is asked for.
EXPORTED void* makeScriptedPlugIn(const void*, const void*) {
    static ComGUIModuleInterface header;
    static ComGUIModuleInterface* object = &header;
    header.QueryInterface = [](void*, CFUUIDBytes id, void** interface) {
        static ComGUIModuleInterface table = operations();
        static ComGUIModuleInterface* given = &table;
        const bool known = std::memcmp(id.bytes, interfaceID, sizeof interfaceID) == 0;
        *interface = known && scriptedPlugIn()->hasInterface ? &given : nullptr;
        return 0;
    };
    header.Release = [](void*) -> std::uint32_t {
        answer("Release");
        return 0;
    };
    return &object;
}
