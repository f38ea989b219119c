// SPDX-License-Identifier: Apache-2.0
// A store as a server that records what it is asked and changes nothing.
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
    PARAM_TYPE wanted = PARAM_DELETE; ///< Of the value or of the elements.
    bool isArray = false;
    bool found = false;   ///< The value, or for an array its count.
    int firstUnread = -1; ///< The first element of an array that is no value of this type.
    std::shared_ptr<const store::Elements> stored; ///< Null if there is no such key.
};

/// A file that was requested.
struct AskedFile {
    std::string serverPath;
    std::string localPath;
    std::string problem;   ///< Why it did not come, as a clause for people; empty if it came.
    std::string namedBy;   ///< The text key that was read last before the request.
    std::size_t asked = 0; ///< Number of keys that were asked before.
};

/// The interface of a comm plug-in over a store. Everybody may log in: who examines a store can
/// read its folder or its database anyway. Reads are recorded in their order. Every operation that
/// would change the store is refused.
///
/// One object at a time, since the interface's first operation carries no context.
class ReadOnlyServer {
  public:
    explicit ReadOnlyServer(std::shared_ptr<store::StoreEngine> engine);
    ~ReadOnlyServer();
    ReadOnlyServer(const ReadOnlyServer&) = delete;
    ReadOnlyServer& operator=(const ReadOnlyServer&) = delete;

    /// For ComGUIManager::UseInterface. Good for as long as this object.
    ComGUIModuleInterface** interface() { return &m_interface; }

    const std::vector<AskedKey>& keys() const { return m_keys; }
    const std::vector<AskedFile>& files() const { return m_files; }

    /// Removes the empty file that took the place of a file that did not come. The connector waits
    /// for files; the empty one ends the wait. It is removed before the next read in any case.
    void removePlaceholder();

    /// Throws the store's failure if one has interrupted the recording. What was recorded then
    /// describes the failure and not the job.
    void throwFailure() const;

    // What the interface's operations do.

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
