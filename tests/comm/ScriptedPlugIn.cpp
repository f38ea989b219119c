#include "tests/comm/ScriptedPlugIn.h"

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

std::string shown(int number) {
    return " " + std::to_string(number);
}
std::string shown(const char* text) {
    return std::string(" ") + (text == nullptr ? "(null)" : text);
}
std::string shown(std::uint64_t session) {
    return session == handle ? "" : " ?";
}
std::string shown(ComSessionRecord* record) {
    scriptedPlugIn()->record = *record;
    record->session = handle;
    return "";
}
std::string shown(int* size) {
    scriptedPlugIn()->size = size;
    return size == nullptr ? "" : shown(*size);
}
std::string shown(void* data) {
    scriptedPlugIn()->data = data;
    return "";
}
std::string shown(TJobIdentification*) {
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

// The object that the factory makes is not the interface that it is asked for.
EXPORTED void* makeScriptedPlugIn(const void*, const void*) {
    static ComGUIModuleInterface header = {.QueryInterface = queryInterface, .Release = release};
    static ComGUIModuleInterface* object = &header;
    return &object;
}
