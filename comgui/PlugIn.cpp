// SPDX-License-Identifier: Apache-2.0
// ComGUI.Bundle's shared object: the table of operations, and the function that makes its object.
//
// Instances, sessions and tickets that come back from outside are looked up before anything is done
// with them, and no exception leaves a slot.
#include <cstring>
#include <map>
#include <memory>
#include <set>
#include <string>

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIModuleInterface.h"
#include "comgui/Session.h"
#include "store/Users.h"
#include "store/tickets/WorkTickets.h"

namespace store {

namespace {

/// 33FC3B14-6CFF-11D8-AB09-003065B1346E, that is comGUIInterfaceID.
constexpr CFUUIDBytes interfaceId = {{0x33, 0xFC, 0x3B, 0x14, 0x6C, 0xFF, 0x11, 0xD8, 0xAB, 0x09,
                                      0x00, 0x30, 0x65, 0xB1, 0x34, 0x6E}};

/// What CreateInstance makes.
struct Instance {
    std::map<std::uint64_t, std::unique_ptr<Session>> sessions; ///< By handle.
};

/// Neither instances nor sessions that nobody closed are destroyed with the process: a client may
/// still hold pointers into them while it ends.
std::map<const void*, std::unique_ptr<Instance>>& instances() {
    static auto& all = *new std::map<const void*, std::unique_ptr<Instance>>;
    return all;
}

/// Null for an instance that was never made.
Instance* find(const void* instance) {
    const auto found = instances().find(instance);
    return found == instances().end() ? nullptr : found->second.get();
}

/// Null for a session that is not open, or that another instance opened.
Session* find(const void* instance, std::uint64_t handle) {
    auto* const known = find(instance);
    if (known == nullptr) {
        return nullptr;
    }
    const auto found = known->sessions.find(handle);
    return found == known->sessions.end() ? nullptr : found->second.get();
}

/// Runs a slot. Failures become codes here.
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

/// A text of the record, be it without an end.
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

/// Login reads the record again, since the client may change it until then.
std::int32_t initialize(void* instance, ComSessionRecord* record) {
    return answer([&] {
        return find(instance) == nullptr || !isUsable(record) ? Code::Refused : Code::Done;
    });
}

std::int32_t uninitialize(void* instance, ComSessionRecord* record) {
    return initialize(instance, record);
}

/// What keeps a client from opening a store is, but for the formats, that there is none for it.
std::unique_ptr<StoreEngine> openForLogin(const std::string& address) {
    try {
        return openStoreAt(address);
    } catch (const StoreFailure& failure) {
        if (failure.fault == Fault::Newer || failure.fault == Fault::Older) {
            throw;
        }
        throw StoreFailure(Fault::Missing, failure.what());
    }
}

std::int32_t login(void* instance, ComSessionRecord* record) {
    return answer([&] {
        Instance* const known = find(instance);
        if (known == nullptr || !isUsable(record)) {
            return Code::Refused;
        }
        const std::string address = textOf(record->server);
        auto engine = openForLogin(address);
        switch (checkLogin(*engine, textOf(record->user), textOf(record->password))) {
        case LoginAnswer::WrongUserOrPassword:
            return Code::WrongUserOrPassword;
        case LoginAnswer::Disabled:
            return Code::UserDisabled;
        case LoginAnswer::Welcome:
            break;
        }
        // Never used twice, so that a handle of a session that has ended is none.
        static std::uint64_t lastHandle = 0;
        known->sessions.emplace(lastHandle + 1,
                                std::make_unique<Session>(address, std::move(engine)));
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

/// No kind of whole-ticket data is written here.
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

/// A store prints nothing: there is nobody to hand a job to.
std::int32_t sendJob(void*, std::uint64_t, TJobIdentification*, const char*, const char*) {
    return Code::Refused;
}

/// Answered from a session with this store if there is one, which then tries to reach a server that
/// it has lost; otherwise from the store itself. A store
/// of another format is alive: what is wrong with it is for the login to say.
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

/// There is one object, which stays for good; who counts its references may do so.
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

/// Named in the bundle's Info.plist.
extern "C" __attribute__((visibility("default"))) void* makeComGUI(const void*, const void*) {
    static const ComGUIModuleInterface* object = store::theObject();
    return &object;
}
