// SPDX-License-Identifier: Apache-2.0
#include "comgui/Session.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <utility>

#include "base/FileDraft.h"
#include "base/Utf8.h"
#include "platform/TemporaryFolder.h"
#include "store/WriteFailures.h"
#include "store/tickets/TicketRecord.h"

namespace store {

namespace {

constexpr std::size_t longestAddress = 127;

template<class T>
void put(void* to, const T& value) {
    std::memcpy(to, &value, sizeof value);
}

} // namespace

Code codeOf(const StoreFailure& failure) {
    switch (failure.status) {
    case Fault::Newer:
        return Code::StoreIsNewer;
    case Fault::Older:
        return Code::StoreIsOlder;
    case Fault::BadPath:
        return Code::BadPath;
    case Fault::NoFile:
        return Code::NoFile;
    case Fault::ReadOnly:
    case Fault::Full:
    case Fault::Busy:
        return Code::NotWritten;
    default:
        return Code::NoStore;
    }
}

std::unique_ptr<StoreEngine> openStoreAt(const std::string& address) {
    if (address.empty() || address.size() > longestAddress) {
        throw StoreFailure(Fault::Missing, "no server address");
    }
    try {
        return openStore(address);
    } catch (const StoreFailure& failure) {
        const bool ascii =
            std::all_of(address.begin(), address.end(), [](unsigned char c) { return c < 0x80; });
        if (failure.status != Fault::Missing || ascii) {
            throw;
        }
    }
    return openStore(base::utf8FromLatin1(address));
}

Session::Session(std::string address, std::string user, std::unique_ptr<StoreEngine> engine)
    : m_address(std::move(address)), m_user(std::move(user)), m_engine(std::move(engine)),
      m_storage(std::make_shared<CachingStorage>(
          m_engine,
          [this](int type, int id, const std::string& key, const std::string& reason) {
              noteFailure(ticketNameOf(type, id), key, reason);
          })),
      m_container(m_storage) {}

void Session::noteFailure(const std::string& target, const std::string& key,
                          const std::string& reason) const {
    WriteFailures(platform::temporaryFolder())
        .add({std::time(nullptr), m_address, target, key, reason});
    m_engine->log({std::time(nullptr), Event::LostWrite, m_user, thisOrigin(),
                   target + (key.empty() ? "" : " " + key) + ": " + reason});
}

Code Session::getTicketData(int type, int kind, int index, int* size, void* buffer) {
    constexpr int numberKind = 0;
    constexpr int idsKind = 1;
    if (!TICKET_TYPE_Valid(type) || (kind != numberKind && kind != idsKind) || index != 0 ||
        size == nullptr || *size < 0 || buffer == nullptr) {
        return Code::Refused;
    }
    const std::vector<int> ids = m_storage->listIds(type);
    if (kind == numberKind) {
        const int number = static_cast<int>(ids.size());
        if (*size < static_cast<int>(sizeof number)) {
            return Code::Refused;
        }
        put(buffer, number);
        *size = sizeof number;
        return Code::Done;
    }
    const std::size_t fitting = std::min(ids.size(), static_cast<std::size_t>(*size) / sizeof(int));
    if (fitting != 0) {
        std::memcpy(buffer, ids.data(), fitting * sizeof(int));
    }
    *size = static_cast<int>(fitting * sizeof(int));
    return Code::Done;
}

Code Session::sendCommand(std::string_view command, int size, void* data) {
    if (command == "local.set.callback") {
        return setCallback(data);
    }
    std::string* const folder = command == "local.set.previewfolder"     ? &m_previewFolder
                                : command == "local.set.thumbnailfolder" ? &m_thumbnailFolder
                                                                         : nullptr;
    if (folder == nullptr || size < 0 || data == nullptr) {
        return Code::Refused;
    }
    const auto* const text = static_cast<const char*>(data);
    folder->assign(text, strnlen(text, static_cast<std::size_t>(size)));
    return Code::Done;
}

/// Takes the client's pointer from the ticket, and stores the number with which the client then
/// enables notifications. This store accepts and remembers them but never sends any.
Code Session::setCallback(void* ticket) {
    const auto found = findTicket(ticket);
    if (found == nullptr) {
        return Code::Refused;
    }
    void* user = nullptr;
    found->get("pUser", PARAM_POINTER, &user, POSITION_WHOLE);
    static int lastNotificationId = 0;
    const int id = m_notificationId != 0 ? m_notificationId : lastNotificationId + 1;
    const bool told = setSingle("iGUINotificationID", PARAM_INT, &id, POSITION_WHOLE,
                                [&](SETMULTIPAR* table) { return found->apply(table); });
    if (!told) {
        return Code::Refused;
    }
    lastNotificationId = std::max(lastNotificationId, id);
    m_notificationId = id;
    m_callbackUser = user;
    return Code::Done;
}

Code Session::putFile(const std::string& local, const std::string& server) {
    std::error_code failure;
    // A pipe would block until it has a writer.
    if (!std::filesystem::is_regular_file(local, failure)) {
        return Code::NoFile;
    }
    std::ifstream from(local, std::ios::binary);
    if (!from) {
        return Code::NoFile;
    }
    try {
        m_engine->putFile(server, from);
    } catch (const StoreFailure& failure) {
        noteFailure("file", server, failure.what());
        throw;
    }
    return Code::Done;
}

Code Session::getFile(const std::string& local, const std::string& server) {
    if (local.empty()) {
        return Code::Refused;
    }
    base::FileDraft copy(local);
    std::ofstream stream(copy.isOpen() ? copy.path() : "", std::ios::binary);
    if (!stream) {
        return Code::NotWritten;
    }
    m_engine->getFile(server, stream);
    stream.close();
    return stream && copy.replace(local, base::Flush::No) ? Code::Done : Code::NotWritten;
}

} // namespace store
