// SPDX-License-Identifier: Apache-2.0
// One login to a store.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "store/CachingStorage.h"
#include "store/StoreEngine.h"
#include "store/tickets/TicketContainer.h"

namespace store {

/// Result codes of the plug-in's slots. A failed login gives one of the first five.
enum Code : std::int32_t {
    Done = 0,
    WrongUserOrPassword = -2004,
    NoStore = -2005, ///< No store, or one that this process may not use.
    UserDisabled = -2030,
    StoreIsNewer = -2031,
    StoreIsOlder = -2033,
    Refused = -1,    ///< An invalid argument, handle or command.
    NoFile = -2050,  ///< The server has no such file.
    BadPath = -2051, ///< A server path outside the store's files, or a folder.
    NotWritten = -2052,
};

Code codeOf(const StoreFailure& failure);

/// Opens the store at a server address of at most 127 bytes. Clients pass it as one byte per
/// character, so an address that leads nowhere is tried again as Latin-1.
std::unique_ptr<StoreEngine> openStoreAt(const std::string& address);

class Session {
  public:
    Session(std::string address, std::string user, std::unique_ptr<StoreEngine> engine);

    const std::string& address() const { return m_address; }
    bool alive() const { return m_engine->alive(); }
    const MTICKET_ACCESS* container() const { return m_container.access(); }

    // Like the slots of these names, with external arguments checked for null.

    Code getTicketData(int type, int kind, int index, int* size, void* buffer);
    Code sendCommand(std::string_view command, int size, void* data);
    /// From a local file to a server path.
    Code putFile(const std::string& local, const std::string& server);
    /// The local file appears complete, before this returns.
    Code getFile(const std::string& local, const std::string& server);

    const std::string& previewFolder() const { return m_previewFolder; }
    const std::string& thumbnailFolder() const { return m_thumbnailFolder; }

  private:
    Code setCallback(void* ticket);
    void noteFailure(const std::string& target, const std::string& key,
                     const std::string& reason) const;

    const std::string m_address;
    const std::string m_user;
    const std::shared_ptr<StoreEngine> m_engine;
    const std::shared_ptr<CachingStorage> m_storage;
    TicketContainer m_container;
    int m_notificationId = 0; ///< 0 if there is no callback.
    void* m_callbackUser = nullptr;
    std::string m_previewFolder;
    std::string m_thumbnailFolder;
};

} // namespace store
