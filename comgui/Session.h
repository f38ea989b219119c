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

/// What slots of the plug-in's table answer. A login that fails gives one of the first five.
enum Code : std::int32_t {
    Done = 0,
    WrongUserOrPassword = -2004,
    NoStore = -2005, ///< Nor one that this process may use.
    UserDisabled = -2030,
    StoreIsNewer = -2031,
    StoreIsOlder = -2033,
    Refused = -1,    ///< An argument, handle or command that means nothing here.
    NoFile = -2050,  ///< The server has no such file.
    BadPath = -2051, ///< A server path that leads out of the store's files, or to a folder.
    NotWritten = -2052,
};

Code codeOf(const StoreFailure& failure);

/// Opens the store at a server address, which has at most 127 bytes. Client programs pass it one
/// byte a character, so that what leads nowhere as it stands is tried as Latin-1.
std::unique_ptr<StoreEngine> openStoreAt(const std::string& address);

class Session {
  public:
    Session(std::string address, std::unique_ptr<StoreEngine> engine);

    const std::string& address() const { return m_address; }
    bool alive() const { return m_engine->alive(); }
    const MTICKET_ACCESS* container() const { return m_container.access(); }

    // As the slots of these names, with what came from outside checked for null.

    Code getTicketData(int type, int kind, int index, int* size, void* buffer);
    Code sendCommand(std::string_view command, int size, void* data);
    /// From a local file to a server path.
    Code putFile(const std::string& local, const std::string& server);
    /// The local file appears complete, and does so before this returns.
    Code getFile(const std::string& local, const std::string& server);

    const std::string& previewFolder() const { return m_previewFolder; }
    const std::string& thumbnailFolder() const { return m_thumbnailFolder; }

  private:
    Code setCallback(void* ticket);
    void noteFailure(const std::string& target, const std::string& key,
                     const std::string& reason) const;

    const std::string m_address;
    const std::shared_ptr<StoreEngine> m_engine;
    const std::shared_ptr<CachingStorage> m_storage;
    TicketContainer m_container;
    int m_notificationId = 0; ///< 0: there is no callback.
    void* m_callbackUser = nullptr;
    std::string m_previewFolder;
    std::string m_thumbnailFolder;
};

} // namespace store
