// SPDX-License-Identifier: Apache-2.0
// Presents a store as a server that records every read and changes nothing.
#pragma once

#include <cstdint>
#include <exception>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIModuleInterface.h"
#include "store/CachingStorage.h"
#include "store/StoreEngine.h"
#include "store/tickets/TicketContainer.h"

namespace diagnosis {

/// A key that was read: one value, or an array with its count and elements.
struct AskedKey {
    int type = 0;
    int id = 0;
    std::string key;
    PARAM_TYPE wanted = PARAM_DELETE; ///< Type of the value or of the elements.
    bool isArray = false;
    bool found = false;   ///< The value, or an array's count.
    int firstUnread = -1; ///< The first element that can't be read as this type.
    std::shared_ptr<const store::Elements> stored; ///< Null if the key does not exist.
};

/// A file that was requested.
struct AskedFile {
    std::string serverPath;
    std::string localPath;
    std::string problem;   ///< Why it was not downloaded, as a clause; empty if it was.
    std::string namedBy;   ///< The last text key read before the request.
    std::size_t asked = 0; ///< Number of keys read before the request.
};

/// A comm plug-in's interface to a store. Any login succeeds: whoever examines a store can read its
/// folder or its database anyway. Reads are recorded in their order. Every operation that would
/// change the store is refused.
///
/// Only one object may exist at a time, because the interface's first operation has no context.
class ReadOnlyServer {
  public:
    explicit ReadOnlyServer(std::shared_ptr<store::StoreEngine> engine);
    ~ReadOnlyServer();
    ReadOnlyServer(const ReadOnlyServer&) = delete;
    ReadOnlyServer& operator=(const ReadOnlyServer&) = delete;

    /// For ComGUIManager::UseInterface. Valid as long as this object.
    ComGUIModuleInterface** interface() { return &m_interface; }

    const std::vector<AskedKey>& keys() const { return m_keys; }
    const std::vector<AskedFile>& files() const { return m_files; }

    /// Removes the empty file that replaces a file that could not be downloaded. It exists because
    /// the connector waits for files. It is also removed before the next read.
    void removePlaceholder();

    /// Throws the store's failure if one has interrupted the recording. The records made after it
    /// describe the failure and not the job.
    void throwFailure() const;

    // Implementation of the interface's operations.

    const MTICKET_ACCESS* container() const { return &m_access; }
    bool readKey(int type, int id, const char* key, PARAM_TYPE ptype, void* out, int position);
    bool exists(int type, int id);
    std::int32_t listTickets(int type, int kind, int* size, void* buffer);
    std::int32_t getFile(const char* local, const char* server);

  private:
    AskedKey& recordOf(int type, int id, const char* key, PARAM_TYPE ptype, int position);
    template<class Result, class Body>
    Result guarded(Result failed, Body body);

    const std::shared_ptr<store::StoreEngine> m_engine;
    const std::shared_ptr<store::CachingStorage> m_storage;
    store::TicketContainer m_container;
    MTICKET_ACCESS m_access{};
    ComGUIModuleInterface m_table;
    ComGUIModuleInterface* m_interface = &m_table;
    std::vector<AskedKey> m_keys;
    std::vector<AskedFile> m_files;
    std::string m_placeholder; ///< Path of the empty file, or empty.
    std::exception_ptr m_failure;
};

} // namespace diagnosis
