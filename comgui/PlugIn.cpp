// SPDX-License-Identifier: Apache-2.0
// ComGUI.Bundle's shared object: the table of operations, and the function that creates its object.
//
// Instances, sessions and tickets passed in by a client are looked up before use, and no exception
// leaves a slot.
#include <cstring>
#include <ctime>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <thread>

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIModuleInterface.h"
#include "comgui/Session.h"
#include "store/Users.h"
#include "store/tickets/WorkTickets.h"

namespace store {

namespace {

/// The bytes of comGUIInterfaceID.
constexpr CFUUIDBytes interfaceId = {{0x33, 0xFC, 0x3B, 0x14, 0x6C, 0xFF, 0x11, 0xD8, 0xAB, 0x09,
                                      0x00, 0x30, 0x65, 0xB1, 0x34, 0x6E}};

/// Created by CreateInstance.
struct Instance {
    std::map<std::uint64_t, std::unique_ptr<Session>> sessions; ///< By handle.
};

/// Open instances and sessions are never destroyed, not even at exit: a client may still have
/// pointers into them.
std::map<const void*, std::unique_ptr<Instance>>& instances() {
    static auto& all = *new std::map<const void*, std::unique_ptr<Instance>>;
    return all;
}

/// Null for an unknown instance.
Instance* find(const void* instance) {
    const auto found = instances().find(instance);
    return found == instances().end() ? nullptr : found->second.get();
}

/// Null if the session is not open or belongs to another instance.
Session* find(const void* instance, std::uint64_t handle) {
    auto* const known = find(instance);
    if (known == nullptr) {
        return nullptr;
    }
    const auto found = known->sessions.find(handle);
    return found == known->sessions.end() ? nullptr : found->second.get();
}

/// Runs a slot and converts failures to codes.
template<class Body>
std::int32_t answer(Body body) {
    try {
        return body();
    } catch (const StoreFailure& failure) {
        return codeOf(failure);
    } catch (...) {
        return Code::Refused;
    }
}

template<class Body>
std::int32_t inSession(const void* instance, std::uint64_t handle, Body body) {
    return answer([&]() -> std::int32_t {
        Session* const session = find(instance, handle);
        return session == nullptr ? Code::Refused : body(*session);
    });
}

/// A text of the record, with or without a terminator.
template<std::size_t Size>
std::string textOf(const char (&field)[Size]) {
    return {field, strnlen(field, Size - 1)};
}

bool isUsable(const ComSessionRecord* record) {
    return record != nullptr && record->size == sizeof(ComSessionRecord);
}

std::int32_t createInstance(void** instance) {
    return answer([&] {
        if (instance == nullptr) {
            return Code::Refused;
        }
        auto made = std::make_unique<Instance>();
        void* const word = made.get();
        instances().emplace(word, std::move(made));
        *instance = word;
        return Code::Done;
    });
}

/// Stores nothing: Login reads the record, and the client may change it until then.
std::int32_t initialize(void* instance, ComSessionRecord* record) {
    return answer([&] {
        return find(instance) == nullptr || !isUsable(record) ? Code::Refused : Code::Done;
    });
}

std::int32_t uninitialize(void* instance, ComSessionRecord* record) {
    return initialize(instance, record);
}

/// Any failure to open a store is reported as a missing store, except an unsupported format.
std::unique_ptr<StoreEngine> openForLogin(const std::string& address) {
    try {
        return openStoreAt(address);
    } catch (const StoreFailure& failure) {
        if (failure.status == Fault::Newer || failure.status == Fault::Older) {
            throw;
        }
        throw StoreFailure(Fault::Missing, failure.what());
    }
}

/// Notes a login that is refused, and keeps whoever tries again and again waiting. A name that is
/// no user's is not noted: people type their passwords in the wrong place.
void refuse(StoreEngine& engine, const std::string& user, const std::string& why) {
    const std::int64_t now = std::time(nullptr);
    std::string known;
    try {
        known = engine.user(user) ? user : "";
    } catch (const StoreFailure&) { // The refusal stays the answer.
    }
    engine.log({now, Event::Refusal, known, thisOrigin(), why});
    std::this_thread::sleep_for(
        refusalDelay(engine.refusalsSince(now - std::int64_t{refusalsCount.count()})));
}

std::int32_t login(void* instance, ComSessionRecord* record) {
    return answer([&] {
        Instance* const known = find(instance);
        if (known == nullptr || !isUsable(record)) {
            return Code::Refused;
        }
        const std::string address = textOf(record->server);
        auto engine = openForLogin(address);
        const std::string user = textOf(record->user);
        switch (checkLogin(*engine, user, textOf(record->password))) {
        case LoginAnswer::WrongUserOrPassword:
            refuse(*engine, user, "wrong user or password");
            return Code::WrongUserOrPassword;
        case LoginAnswer::Disabled:
            refuse(*engine, user, "the user is disabled");
            return Code::UserDisabled;
        case LoginAnswer::Welcome:
            engine->log({std::time(nullptr), Event::Login, user, thisOrigin(), ""});
            break;
        }
        // Never reused, so that the handle of an ended session stays invalid.
        static std::uint64_t lastHandle = 0;
        known->sessions.emplace(lastHandle + 1,
                                std::make_unique<Session>(address, user, std::move(engine)));
        record->session = ++lastHandle;
        return Code::Done;
    });
}

std::int32_t logout(void* instance, std::uint64_t handle) {
    return answer([&] {
        Instance* const known = find(instance);
        return known != nullptr && known->sessions.erase(handle) != 0 ? Code::Done : Code::Refused;
    });
}

const MTICKET_ACCESS* getContainer(void* instance, std::uint64_t handle) {
    const Session* const session = find(instance, handle);
    return session == nullptr ? nullptr : session->container();
}

std::int32_t getTicketData(void* instance, std::uint64_t handle, int type, int kind, int index,
                           int* size, void* buffer) {
    return inSession(instance, handle, [&](Session& session) {
        return session.getTicketData(type, kind, index, size, buffer);
    });
}

/// No kind of whole-ticket data can be written.
std::int32_t setTicketData(void*, std::uint64_t, int, int, int, int*, void*) {
    return Code::Refused;
}

std::int32_t sendCommand(void* instance, std::uint64_t handle, const char* command, int size,
                         void* data) {
    return inSession(instance, handle, [&](Session& session) {
        return command == nullptr ? Code::Refused : session.sendCommand(command, size, data);
    });
}

std::int32_t putFile(void* instance, std::uint64_t handle, const char* first, const char* second) {
    return inSession(instance, handle, [&](Session& session) {
        return first == nullptr || second == nullptr ? Code::Refused
                                                     : session.putFile(first, second);
    });
}

std::int32_t getFile(void* instance, std::uint64_t handle, const char* first, const char* second) {
    return inSession(instance, handle, [&](Session& session) {
        return first == nullptr || second == nullptr ? Code::Refused
                                                     : session.getFile(first, second);
    });
}

/// A store can't print, so it can't accept jobs.
std::int32_t sendJob(void*, std::uint64_t, TJobIdentification*, const char*, const char*) {
    return Code::Refused;
}

/// Answers from an open session with this store if there is one, which then tries to reconnect to a
/// lost server; otherwise opens the store. A store of another format counts as alive: the login
/// reports that problem.
std::int32_t isAlive(void* instance, const char* host, int) {
    constexpr std::int32_t alive = 0;
    constexpr std::int32_t silent = 2;
    const std::int32_t result = answer([&]() -> std::int32_t {
        const Instance* const known = find(instance);
        if (known == nullptr || host == nullptr) {
            return Code::NoStore;
        }
        for (const auto& [handle, session] : known->sessions) {
            if (session->address() == host) {
                return session->alive() ? Code::Done : Code::NoStore;
            }
        }
        openForLogin(host);
        return Code::Done;
    });
    const bool answered =
        result == Code::Done || result == Code::StoreIsNewer || result == Code::StoreIsOlder;
    return answered ? alive : silent;
}

std::int32_t queryInterface(void* object, CFUUIDBytes id, void** interface) {
    constexpr std::int32_t noInterface = static_cast<std::int32_t>(0x80000004);
    if (interface == nullptr) {
        return noInterface;
    }
    const bool known = std::memcmp(id.bytes, interfaceId.bytes, sizeof id.bytes) == 0;
    *interface = known ? object : nullptr;
    return known ? 0 : noInterface;
}

/// There is a single permanent object, so references need no count.
std::uint32_t countReference(void*) {
    return 1;
}

/// The object: its first word points to the table.
const ComGUIModuleInterface* theObject() {
    static const ComGUIModuleInterface table = {
        .QueryInterface = queryInterface,
        .AddRef = countReference,
        .Release = countReference,
        .CreateInstance = createInstance,
        .Initialize = initialize,
        .Login = login,
        .Logout = logout,
        .Uninitialize = uninitialize,
        .GetContainer = getContainer,
        .GetTicketData = getTicketData,
        .SetTicketData = setTicketData,
        .SendCommand = sendCommand,
        .PutFile = putFile,
        .GetFile = getFile,
        .SendJob = sendJob,
        .PutFileRaw = putFile,
        .hSTicketInstance = ticketFactory(),
        .GetFileRaw = getFile,
        .IsAlive = isAlive,
    };
    return &table;
}

} // namespace

} // namespace store

/// Info.plist names this function.
extern "C" __attribute__((visibility("default"))) void* makeComGUI(const void*, const void*) {
    static const ComGUIModuleInterface* object = store::theObject();
    return &object;
}
