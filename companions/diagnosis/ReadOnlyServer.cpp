// SPDX-License-Identifier: Apache-2.0
#include "companions/diagnosis/ReadOnlyServer.h"

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <system_error>
#include <utility>

#include "store/tickets/WorkTickets.h"

namespace diagnosis {

namespace {

constexpr std::int32_t done = 0;
constexpr std::int32_t refused = -1;
constexpr std::uint64_t onlySession = 1;

ReadOnlyServer* current = nullptr;

ReadOnlyServer& serverOf(void* instance) {
    return *static_cast<ReadOnlyServer*>(instance);
}

template<class... Arguments>
std::int32_t agree(Arguments...) {
    return done;
}

template<class... Arguments>
std::int32_t refuse(Arguments...) {
    return refused;
}

/// The result of a slot that would change a ticket.
template<class... Arguments>
int decline(Arguments...) {
    return 0;
}

const STICKET_ACCESS* openNothing(void*, int, int, const char* const*) {
    return nullptr;
}

std::int32_t createInstance(void** instance) {
    *instance = current;
    return current != nullptr ? done : refused;
}

std::int32_t login(void*, ComSessionRecord* record) {
    record->session = onlySession;
    return done;
}

const MTICKET_ACCESS* getContainer(void* instance, std::uint64_t) {
    return serverOf(instance).container();
}

std::int32_t getTicketData(void* instance, std::uint64_t, int type, int kind, int, int* size,
                           void* buffer) {
    return serverOf(instance).listTickets(type, kind, size, buffer);
}

std::int32_t getFile(void* instance, std::uint64_t, const char* local, const char* server) {
    return serverOf(instance).getFile(local, server);
}

int getParameter(void* handle, int type, int id, const char* key, PARAM_TYPE ptype, void* out,
                 int position) {
    return serverOf(handle).readKey(type, id, key, ptype, out, position) ? 1 : 0;
}

/// Of the operations on a ticket, only the test whether it exists changes nothing. An opened ticket
/// could be written.
int ticketOperation(void* handle, int type, int id, TICKET_OP op, void*) {
    return op.code == MTICKET_OP_EXISTS && serverOf(handle).exists(type, id) ? 1 : 0;
}

} // namespace

ReadOnlyServer::ReadOnlyServer(std::shared_ptr<store::StoreEngine> engine)
    : m_engine(std::move(engine)), m_storage(std::make_shared<store::CachingStorage>(m_engine)),
      m_container(m_storage) {
    current = this;
    namespace slot = ticket::container;
    m_access.words[ticket::handleWord] = reinterpret_cast<std::uint64_t>(this);
    slot::GetParameter::put(m_access, getParameter);
    slot::GetMultiParameter::put(m_access, decline);
    slot::WalkTickets::put(m_access, decline);
    slot::SetParameter::put(m_access, decline);
    slot::SetMultiParameter::put(m_access, decline);
    slot::TicketOperation::put(m_access, ticketOperation);
    slot::Notification::put(m_access, decline);
    slot::CreateWithKeys::put(m_access, openNothing);
    m_table = {
        .QueryInterface = refuse,
        .AddRef = nullptr,
        .Release = nullptr,
        .CreateInstance = createInstance,
        .Initialize = agree,
        .Login = login,
        .Logout = agree,
        .Uninitialize = agree,
        .GetContainer = diagnosis::getContainer,
        .GetTicketData = getTicketData,
        .SetTicketData = refuse,
        .SendCommand = refuse,
        .PutFile = refuse,
        .GetFile = diagnosis::getFile,
        .SendJob = refuse,
        .PutFileRaw = refuse,
        .hSTicketInstance = store::ticketFactory(),
        .GetFileRaw = diagnosis::getFile,
        .IsAlive = agree,
    };
}

ReadOnlyServer::~ReadOnlyServer() {
    current = nullptr;
}

template<class Result, class Body>
Result ReadOnlyServer::guarded(Result failed, Body body) {
    try {
        removePlaceholder();
        return body();
    } catch (...) {
        if (m_failure == nullptr) {
            m_failure = std::current_exception();
        }
        return failed;
    }
}

void ReadOnlyServer::throwFailure() const {
    if (m_failure != nullptr) {
        std::rethrow_exception(m_failure);
    }
}

void ReadOnlyServer::removePlaceholder() {
    std::error_code ignored;
    std::filesystem::remove(std::exchange(m_placeholder, std::string()), ignored);
}

/// The count and the elements of an array share one record.
AskedKey& ReadOnlyServer::recordOf(int type, int id, const char* key, PARAM_TYPE ptype,
                                   int position) {
    if (position >= 0 && !m_keys.empty()) {
        AskedKey& last = m_keys.back();
        if (last.isArray && last.type == type && last.id == id && last.key == key) {
            return last;
        }
    }
    m_keys.push_back({.type = type,
                      .id = id,
                      .key = key,
                      .isArray = ptype == PARAM_COUNT,
                      .stored = m_engine->key(type, id, key)});
    return m_keys.back();
}

bool ReadOnlyServer::readKey(int type, int id, const char* key, PARAM_TYPE ptype, void* out,
                             int position) {
    return guarded(false, [&] {
        AskedKey& asked = recordOf(type, id, key, ptype, position);
        const bool found = m_container.get(type, id, key, ptype, out, position);
        if (ptype != PARAM_COUNT) {
            asked.wanted = ptype;
        }
        if (!asked.isArray || position < 0) {
            asked.found = found && asked.stored != nullptr; // Another process may just have set it.
        } else if (!found && asked.firstUnread < 0) {
            asked.firstUnread = position;
        }
        return found;
    });
}

bool ReadOnlyServer::exists(int type, int id) {
    return guarded(false, [&] { return m_engine->exists(type, id); });
}

std::int32_t ReadOnlyServer::listTickets(int type, int kind, int* size, void* buffer) {
    return guarded(refused, [&] {
        const std::vector<int> ids = m_storage->listIds(type);
        const int number = static_cast<int>(ids.size());
        const std::size_t bytes = std::min(static_cast<std::size_t>(*size),
                                           kind == 0 ? sizeof number : ids.size() * sizeof(int));
        if (bytes != 0) {
            std::memcpy(buffer, kind == 0 ? &number : ids.data(), bytes);
        }
        *size = static_cast<int>(bytes);
        return done;
    });
}

std::int32_t ReadOnlyServer::getFile(const char* local, const char* server) {
    return guarded(refused, [&] {
        const auto text = std::find_if(m_keys.rbegin(), m_keys.rend(), [](const AskedKey& key) {
            return key.found && key.wanted == PARAM_STRING;
        });
        AskedFile file{.serverPath = server,
                       .localPath = local,
                       .problem = {},
                       .namedBy = text == m_keys.rend() ? std::string() : text->key,
                       .asked = m_keys.size()};
        std::ofstream copy(local, std::ios::binary | std::ios::trunc);
        try {
            if (!copy) {
                file.problem = "no file of this name can be created in the job's folder";
            } else {
                m_engine->getFile(server, copy);
                copy.close();
                file.problem = copy ? "" : "it could not be copied to the temporary folder";
            }
        } catch (const store::StoreFailure& failure) {
            using store::Fault;
            if (failure.status == Fault::Lost || failure.status == Fault::Busy ||
                failure.status == Fault::Damaged) {
                throw; // The failure affects more than this file.
            }
            file.problem = failure.what();
        }
        if (copy.is_open()) {
            copy.close();
        }
        if (!file.problem.empty()) {
            std::ofstream(local, std::ios::trunc).flush(); // Truncates a partial download.
            m_placeholder = local;
        }
        m_files.push_back(file);
        return file.problem.empty() ? done : refused;
    });
}

} // namespace diagnosis
